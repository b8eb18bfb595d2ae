#include "Tests/Scanner/ScannerTest.h"

#include <QFile>

namespace {

class ScannerLog : public ScannerTest {
protected:
    QString logPath() const { return m_folder.path(QStringLiteral("other.log")); }
    QString foreign() const { return m_folder.path(QString::fromUtf8("無い 🎛 ö")); }
    QByteArray lineAboutForeign() const
    {
        return ": Cannot search the folder \"" + foreign().toUtf8() + "\": it does not exist";
    }
};

} // namespace

TEST_F(ScannerLog, GoesToTheFileNamedElseToStandardError)
{
    const struct {
        const char *name;
        QString file; ///< null: none is named
        bool onStandardError;
    } rows[] = {
        {"no file", {}, true},
        {"a file", logPath(), false},
        {"a file that is there already", logPath(), false},
        {"a folder", m_folder.effects(), true},
        {"a file in a folder that does not exist", m_folder.path(QStringLiteral("no/where")), true},
    };
    int runs = 0;
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        ScannerRun scanner(scannerProgram(), m_folder);
        scanner.removeEnvironment(QStringLiteral("FXPROBE_LOG"));
        if (!row.file.isNull())
            scanner.setEnvironment(QStringLiteral("FXPROBE_LOG"), row.file);
        const ScannerOutcome outcome = scanner.run();
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_EQ(outcome.standardError.count("Plugin Scan Complete"), row.onStandardError ? 1 : 0);
        EXPECT_EQ(outcome.standardOutput, QByteArray());
        runs += row.file == logPath() ? 1 : 0;
        EXPECT_EQ(m_folder.read(logPath()).count("Plugin Scan Complete"), runs);
    }
}

TEST_F(ScannerLog, ForeignTextIsWholeInEveryLocale)
{
    const QString broken = QString::fromUtf8("壊れた 🎛");
    m_folder.write(QStringLiteral("Plugins/%1.vst3").arg(broken), "no library");
    m_folder.writeScanList({foreign(), m_folder.plugins()});
    for (const char *locale : {"C", "POSIX", "C.UTF-8", "de_DE.UTF-8", "de_DE", "ja_JP.SJIS"}) {
        for (const bool toFile : {false, true}) {
            SCOPED_TRACE(std::string(locale) + (toFile ? ", file" : ", standard error"));
            QFile::remove(cataloguePath());
            ScannerRun scanner(scannerProgram(), m_folder);
            scanner.setEnvironment(QStringLiteral("LC_ALL"), QLatin1String(locale));
            if (!toFile)
                scanner.removeEnvironment(QStringLiteral("FXPROBE_LOG"));
            const ScannerOutcome outcome = scanner.run();
            EXPECT_TRUE(outcome.succeeded());
            const QByteArray text = toFile ? outcome.log.toUtf8() : outcome.standardError;
            EXPECT_TRUE(text.contains(lineAboutForeign())) << text.constData();
            EXPECT_GE(text.count(broken.toUtf8()), 1) << text.constData();
            EXPECT_EQ(listed(), QStringList(broken));
        }
    }
}

TEST_F(ScannerLog, TraceLinesAreThereOnlyOnRequest)
{
    const QString module = addModule(QStringLiteral("Comp"));
    for (const char *value : {"", "0", "1"}) {
        SCOPED_TRACE(value);
        QFile::remove(cataloguePath());
        ScannerRun scanner(scannerProgram(), m_folder);
        scanner.setEnvironment(QStringLiteral("FXPROBE_TRACE"), QLatin1String(value));
        const QStringList lines = logLines(scanner.run());
        EXPECT_EQ(lines.contains(QStringLiteral("Probing ") + module), *value == '1')
            << qPrintable(lines.join(QLatin1Char('\n')));
        EXPECT_EQ(lines.isEmpty(), *value != '1') << qPrintable(lines.join(QLatin1Char('\n')));
    }
}
