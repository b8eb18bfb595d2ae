#include "Tests/Main/AudioEngineController/Effects/ScanBench.h"

#include <QFileInfo>

namespace {

const QDateTime kFirstDate({2021, 3, 4}, {5, 6, 7});
const QDateTime kLaterDate({2022, 3, 4}, {5, 6, 7});

/// The text of an element in a record's block; "-" where there is none.
QByteArray elementOf(const QByteArray &block, const QByteArray &name)
{
    const int start = block.indexOf("\t<" + name + '>');
    const int end = block.indexOf("</" + name + '>', start);
    const int content = start + name.size() + 3;
    return start < 0 || end < 0 ? QByteArray("-") : block.mid(content, end - content);
}

} // namespace

QStringList texts(std::initializer_list<const char *> utf8)
{
    QStringList result;
    for (const char *text : utf8)
        result.append(QString::fromUtf8(text));
    return result;
}

ScanBench::ScanBench(const char *catalogue, const QString &ending)
    : m_catalogue(QString::fromLatin1(catalogue))
    , m_ending(ending)
{
    m_folder.writeScanList();
}

QByteArray ScanBench::traceStatement(const QString &name) const
{
    return "trace \"" + m_folder.path("trace").toUtf8() + "\" \"" + QFileInfo(name).fileName().toUtf8() +
           "\"\n";
}

QString ScanBench::dateFirst(const QString &path) const
{
    m_folder.setModified(path, kFirstDate);
    return path;
}

QString ScanBench::modulePath(const QString &name) const
{
    return m_folder.plugins() + '/' + name + m_ending;
}

QString ScanBench::addRaw(const QString &name, const QByteArray &content) const
{
    m_folder.write(modulePath(name), content);
    return dateFirst(modulePath(name));
}

void ScanBench::dateLater(const QString &path) const { m_folder.setModified(path, kLaterDate); }

ScannerOutcome ScanBench::scanOnce() const
{
    m_folder.write("trace", {});
    ScannerRun run(QStringLiteral(FXPROBE), m_folder);
    return run.run();
}

ScannerOutcome ScanBench::scan() const
{
    const ScannerOutcome outcome = scanOnce();
    EXPECT_TRUE(outcome.succeeded()) << "exit code " << outcome.exitCode << ", signal " << outcome.signal
                                     << ", log:\n"
                                     << qPrintable(outcome.log);
    EXPECT_EQ(m_folder.markers(), QStringList());
    return outcome;
}

int ScanBench::scanUntilSettled() const
{
    const int mostRuns = 60;
    return static_cast<int>(runUntilSettled(QStringLiteral(FXPROBE), m_folder, mostRuns).size());
}

void ScanBench::expectSettled() const
{
    const QByteArray before = m_folder.catalogue(m_catalogue);
    scan();
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(m_folder.catalogue(m_catalogue), before);
}

QStringList ScanBench::traceOf(const QString &name) const
{
    QStringList calls;
    for (const QString &line : trace())
        if (line.startsWith(name + ' '))
            calls.append(line.mid(name.size() + 1));
    return calls;
}

QStringList ScanBench::loaded() const
{
    const QString call = " static-constructor";
    QStringList names;
    for (const QString &line : trace())
        if (line.endsWith(call))
            names.append(line.chopped(call.size()));
    return names;
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
    QByteArray catalogue = m_folder.catalogue(m_catalogue);
    const int named = catalogue.indexOf("<Name>" + name.toUtf8() + "</Name>");
    ASSERT_GE(named, 0) << qPrintable(name);
    const int record = catalogue.lastIndexOf("<Effect>", named);
    const QByteArray tag = QByteArray("<") + element + '>';
    const int content = catalogue.indexOf(tag, record) + tag.size();
    catalogue.replace(content, catalogue.indexOf('<', content) - content, value);
    m_folder.write("Effects/" + m_catalogue, catalogue);
}
