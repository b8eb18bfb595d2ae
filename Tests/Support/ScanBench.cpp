#include "Tests/Support/ScanBench.h"

#include "Tests/Support/CLAPFixture.h"
#include "Tests/Support/VST2Fixture.h"
#include "Tests/Support/VST3Fixture.h"

#include <QDirIterator>
#include <QFileInfo>
#include <QRegularExpression>

#include <algorithm>

namespace {

/// The text of an element in a record's block; "-" where there is none.
QByteArray elementOf(const QByteArray &block, const QByteArray &name)
{
    const int start = block.indexOf("\t<" + name + '>');
    const int end = block.indexOf("</" + name + '>', start);
    const int content = start + name.size() + 3;
    return start < 0 || end < 0 ? QByteArray("-") : block.mid(content, end - content);
}

} // namespace

QString ScanBench::scannerProgram() { return QStringLiteral(FXPROBE); }

QString ScanBench::put(const QString &file, const QByteArray &script) const
{
    const QString name = file.section('.', 0, -2);
    const QByteArray quoted = '"' + QFileInfo(name).fileName().toUtf8() + "\"\n";
    QByteArray whole = "trace \"" + m_folder.path("trace").toUtf8() + "\" " + quoted + script;
    if (file.endsWith(".vst2"))
        return dateFirst(addVST2File(m_folder.plugins(), name, whole));
    if (!script.contains("class "))
        whole += "class " + quoted;
    if (file.endsWith(".clap"))
        return dateFirst(addCLAPFile(m_folder.plugins(), name, whole));
    return dateFirst(file.endsWith(".bundle") ? addVST3Bundle(m_folder.plugins(), name, whole)
                                              : addVST3File(m_folder.plugins(), name, whole));
}

QString ScanBench::dateFirst(const QString &path) const
{
    m_folder.setModified(path, QDateTime({2021, 3, 4}, {5, 6, 7}));
    return path;
}

void ScanBench::dateLater(const QString &path) const
{
    m_folder.setModified(path, QDateTime({2022, 3, 4}, {5, 6, 7}));
}

ScannerOutcome ScanBench::scanOnce(const std::map<QString, QString> &environment) const
{
    ScannerRun scanner(scannerProgram(), m_folder);
    for (const auto &[name, value] : environment)
        value.isNull() ? scanner.removeEnvironment(name) : scanner.setEnvironment(name, value);
    forgetTrace();
    return scanner.run();
}

ScannerOutcome ScanBench::scan() const
{
    const ScannerOutcome outcome = scanOnce();
    EXPECT_TRUE(outcome.succeeded()) << outcome.exitCode << ", log:\n" << qPrintable(outcome.log);
    EXPECT_EQ(m_folder.markers(), QStringList());
    return outcome;
}

int ScanBench::scanUntilSettled() const
{
    const int most = 10;
    for (int run = 1; run <= most; ++run)
        if (!ScannerRun(scannerProgram(), m_folder).run().started || m_folder.markers().isEmpty())
            return run;
    ADD_FAILURE() << qPrintable(m_folder.markers().join(", "));
    return most;
}

QStringList ScanBench::traceOf(const QString &name) const
{
    QStringList calls = trace().filter(QRegularExpression('^' + QRegularExpression::escape(name) + ' '));
    return calls.replaceInStrings(QRegularExpression("^.{" + QString::number(name.size() + 1) + '}'), "");
}

QStringList ScanBench::loaded() const
{
    return trace().filter(" static-constructor").replaceInStrings(" static-constructor", "");
}

bool ScanBench::waitForStage(ScannerRun &scanner, const QString &module, const QString &stage) const
{
    return scanner.waitUntil([&] {
        const QStringList calls = traceOf(module);
        return std::any_of(calls.begin(), calls.end(),
                           [&](const QString &call) { return call.startsWith(stage); });
    });
}

QStringList ScanBench::recordsOf(const QString &file, const char *elements) const
{
    QStringList found;
    const QByteArray catalogue = m_folder.catalogue(file);
    for (int at = catalogue.indexOf("\t<Effect>"); at >= 0; at = catalogue.indexOf("\t<Effect>", at + 1)) {
        const QByteArray block = catalogue.mid(at, catalogue.indexOf("\t</Effect>", at) - at);
        QByteArray line;
        for (const QByteArray &element : QByteArray(elements).split(' '))
            line += (line.isNull() ? "" : "|") + elementOf(block, element);
        found.append(QString::fromUtf8(line));
    }
    return found;
}

QStringList ScanBench::sortedRecords(const char *elements) const
{
    QStringList found = records(elements);
    found.sort();
    return found;
}

void ScanBench::mark(const QString &name, const char *element, const QByteArray &value) const
{
    bool isMarked = false;
    for (const char *file : {"VST3Configuration.xml", "FXConfiguration.xml", "CLAPConfiguration.xml"}) {
        QByteArray catalogue = m_folder.catalogue(file);
        const int named = catalogue.indexOf("<Name>" + name.toUtf8() + "</Name>");
        const QByteArray tag = QByteArray("<") + element + '>';
        const int content = catalogue.indexOf(tag, catalogue.lastIndexOf("<Effect>", named)) + tag.size();
        if (named < 0)
            continue;
        catalogue.replace(content, catalogue.indexOf('<', content) - content, value);
        m_folder.write(QLatin1String("Effects/") + file, catalogue);
        isMarked = true;
    }
    EXPECT_TRUE(isMarked) << qPrintable(name);
}

std::map<QString, QByteArray> ScanBench::effectsFolder() const
{
    std::map<QString, QByteArray> contents;
    QDirIterator entries(m_folder.effects(), QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot,
                         QDirIterator::Subdirectories);
    while (entries.hasNext()) {
        const QString path = entries.next();
        contents[path] = m_folder.read(path);
    }
    return contents;
}
