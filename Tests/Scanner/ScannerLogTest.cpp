#include "Tests/Scanner/ScannerTest.h"

#include <QFile>

namespace {

class ScannerLog : public ScannerTest {
protected:
    QString logPath() const { return m_folder.path("other.log"); }
    QString foreign() const { return m_folder.path("無い 🎛 ö"); }
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
        {"a file in a folder that does not exist", m_folder.path("no/where"), true},
    };
    int runs = 0;
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        const ScannerOutcome outcome = run({{"FXPROBE_LOG", row.file}});
        EXPECT_TRUE(outcome.succeeded());
        EXPECT_EQ(outcome.standardError.count("Plugin Scan Complete"), row.onStandardError ? 1 : 0);
        EXPECT_EQ(outcome.standardOutput, QByteArray());
        runs += row.file == logPath() ? 1 : 0;
        EXPECT_EQ(m_folder.read(logPath()).count("Plugin Scan Complete"), runs);
    }
}

TEST_F(ScannerLog, ForeignTextIsWholeInEveryLocale)
{
    const QString broken = "壊れた 🎛";
    m_folder.write(QStringLiteral("Plugins/%1.vst3").arg(broken), "no library");
    m_folder.writeScanList({foreign(), m_folder.plugins()});
    for (const char *locale : {"C", "POSIX", "C.UTF-8", "de_DE.UTF-8", "de_DE", "ja_JP.SJIS"}) {
        for (const bool toFile : {false, true}) {
            SCOPED_TRACE(std::string(locale) + (toFile ? ", file" : ", standard error"));
            QFile::remove(cataloguePath());
            const QString log = m_folder.path("some.log");
            QFile::remove(log);
            const ScannerOutcome outcome =
                run({{"LC_ALL", locale}, {"FXPROBE_LOG", toFile ? log : QString()}});
            EXPECT_TRUE(outcome.succeeded());
            const QByteArray text = toFile ? m_folder.read(log) : outcome.standardError;
            EXPECT_TRUE(text.contains(lineAboutForeign())) << text.constData();
            EXPECT_GE(text.count(broken.toUtf8()), 1) << text.constData();
            EXPECT_EQ(listed(), QStringList(broken));
        }
    }
}

TEST_F(ScannerLog, TraceLinesAreThereOnlyOnRequest)
{
    const QString module = addModule("Comp");
    for (const char *value : {"", "0", "1"}) {
        SCOPED_TRACE(value);
        QFile::remove(cataloguePath());
        const QStringList lines = logLines(run({{"FXPROBE_TRACE", value}}));
        EXPECT_EQ(lines.contains("Probing " + module), *value == '1') << qPrintable(lines.join('\n'));
        EXPECT_EQ(lines.isEmpty(), *value != '1') << qPrintable(lines.join('\n'));
    }
}
