#include "Tests/Scanner/ScannerTest.h"

#include "Core/BaseLib/Files/TextFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Catalogue.h"

#include <QDirIterator>
#include <QFileInfo>
#include <QRegularExpression>

QString scannerProgram() { return QStringLiteral(FXPROBE_SCANNER); }

QByteArray textLines(QByteArray text) { return text.replace("\n", kLineEnd); }

QStringList logLines(const ScannerOutcome &outcome)
{
    static const QRegularExpression timeStamp("^ *\\d+\\.\\d{3}: ");
    QStringList lines = outcome.log.split(QRegularExpression("\r?\n"), Qt::SkipEmptyParts);
    for (QString &line : lines)
        line.remove(timeStamp);
    EXPECT_EQ(lines.removeAll("Plugin Scan Complete"), 1) << qPrintable(outcome.log);
    return lines;
}

ScannerTest::ScannerTest() { m_folder.writeScanList(); }

QString ScannerTest::addModule(const QString &name, const QByteArray &script) const
{
    const QByteArray tracing =
        "trace \"" + tracePath().toUtf8() + "\" \"" + name.toUtf8() + "\"\n" +
        (script.contains("class ") ? QByteArray() : "class \"" + name.toUtf8() + "\"\n") + script;
    return addVST3File(m_folder.plugins(), name, tracing);
}

void ScannerTest::addListedModules(const QStringList &names)
{
    for (const QString &name : names)
        m_folder.setModified(addModule(name), listedTime());
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(listed(), names);
    forgetTrace();
}

void ScannerTest::touchModules(const QStringList &names) const
{
    for (const QString &name : names)
        m_folder.setModified(QStringLiteral("Plugins/%1.vst3").arg(name), touchedTime());
    forgetTrace();
}

void ScannerTest::editCatalogue(const char *from, const char *to) const
{
    QByteArray text = m_folder.catalogue();
    EXPECT_TRUE(text.contains(from)) << text.constData();
    m_folder.write(cataloguePath(), text.replace(from, to));
}

ScannerOutcome ScannerTest::run(const std::map<QString, QString> &environment) const
{
    ScannerRun scanner(scannerProgram(), m_folder);
    for (const auto &[name, value] : environment)
        value.isNull() ? scanner.removeEnvironment(name) : scanner.setEnvironment(name, value);
    return scanner.run();
}

QStringList ScannerTest::loaded() const
{
    const QString ending = " static-constructor";
    QStringList names;
    for (const QString &line : trace())
        if (line.endsWith(ending))
            names.append(line.chopped(ending.size()));
    return names;
}

bool ScannerTest::waitForStage(ScannerRun &scanner, const QString &module, const QString &stage) const
{
    const QString start = module + ' ' + stage;
    return scanner.waitUntil([&] {
        for (const QString &line : trace())
            if (line.startsWith(start))
                return true;
        return false;
    });
}

std::map<QString, EffectRecord> ScannerTest::records() const
{
    const CatalogueContents contents = readCatalogueFile(vst3CatalogueFormat(), cataloguePath());
    EXPECT_EQ(contents.reason, QString());
    EXPECT_TRUE(m_folder.catalogue().endsWith(textLines("</Effects>\n"))) << m_folder.catalogue().constData();
    std::map<QString, EffectRecord> byModule;
    for (const EffectRecord &record : contents.records)
        EXPECT_TRUE(byModule.emplace(QFileInfo(record.path).completeBaseName(), record).second)
            << qPrintable(record.path) << " is listed twice";
    return byModule;
}

QStringList ScannerTest::listed() const
{
    QStringList names;
    for (const auto &entry : records())
        names.append(entry.first);
    return names;
}

std::map<QString, QByteArray> ScannerTest::effectsFolder() const
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
