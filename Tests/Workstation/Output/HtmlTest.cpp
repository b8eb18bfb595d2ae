#include "Tests/Workstation/FxScanBench.h"

#include <QStandardPaths>

using Html = FxScanBench;

TEST_F(Html, ABrowserSortsFiltersAndTakesNoTextForMarkup)
{
    const QString browser = QStandardPaths::findExecutable("chromium");
    if (browser.isEmpty())
        GTEST_SKIP() << "chromium is not installed";
    put("Mono.vst3", "class \"Mono 10\"\nvendor \"Good Works\"\ninputs 1\n");
    put("Stereo.vst2", "name \"mono 9\"\nvendor Works\n");
    put("Evil.vst3", "class \"</script><img src=x onerror='parent.hacked=1;hacked=1'>\"\n"
                     "vendor \"\\\" onerror=\\\"hacked=1\"\n");
    put("It's.vst3", "answer initialize false\n");
    put("Crash.vst3", "fault initialize abort\n");
    put("Shell.vst2", "child 1 One\nchild 2 Two\nfault entry throw-std Two\n");
    ASSERT_EQ(run({"--html", m_folder.path("page.html"), m_folder.plugins()}).exitCode, 0);
    ASSERT_TRUE(QFile::copy(QStringLiteral(FXPROBE_PAGE_DRIVER), m_folder.path("driver.html")));

    ScannerRun chromium(browser, m_folder);
    chromium.setArguments({"--headless", "--no-sandbox", "--disable-gpu", "--disable-dev-shm-usage",
                           "--allow-file-access-from-files", "--user-data-dir=" + m_folder.path("browser"),
                           "--dump-dom", "file://" + m_folder.path("driver.html")});
    const QString dom = QString::fromUtf8(chromium.run().standardOutput);
    QString result = dom.section("<pre id=\"result\">", 1).section("</pre>", 0, 0);
    result.replace("&lt;/script&gt;&lt;img src=x onerror='parent.hacked=1;hacked=1'&gt;", "EVIL");
    EXPECT_EQ(
        result.remove(m_folder.plugins() + '/').split('\n'),
        (QStringList{"at first: EVIL|Crash|It's|Mono 10|mono 9|One|Two",
                     "by name: EVIL|Crash|It's|mono 9|Mono 10|One|Two",
                     "backwards: Two|One|Mono 10|mono 9|It's|Crash|EVIL",
                     "by inputs: Two|It's|Crash|Mono 10|One|mono 9|EVIL", "failed: Two|It's",
                     "VST 2: Two|One|mono 9", "searched: Mono 10|mono 9, 2 of 7 shown",
                     "bars: bar b-crashed Crash.vst3|bar b-failed It's.vst3|bar b-failed Two|bar b-listed "
                     "Evil.vst3|bar b-listed Mono.vst3|bar b-listed One|bar b-listed Shell.so|bar "
                     "b-listed Stereo.so",
                     "inside: true", "commands: retry=Crash.vst3|retry='It'\\''s.vst3'|retry=Two",
                     "strangers: 0", "loads: 0", "wide: true", "narrow: true", ""}))
        << qPrintable(dom);
}

TEST_F(Html, TellsWhatIsThereMoreThanOnceAndWhatHasChanged)
{
    put("Comp.vst3", "class <Comp>\n");
    const QByteArray copy = put("later/Comp.vst3", "class <Comp>\n").toUtf8();
    put("Crash.vst3", "fault initialize abort\n");
    scan();
    const QByteArray changed = "has changed since it crashed";
    EXPECT_FALSE(run({"--list", "--format", "html"}).standardOutput.contains(changed));
    dateLater(put("Crash.vst3"));
    const QByteArray page = run({"--list", "--format", "html"}).standardOutput;
    EXPECT_TRUE(page.contains(changed)) << page.constData();
    EXPECT_TRUE(page.contains("<li><bdi>&lt;Comp&gt;</bdi> <bdi class=\"format\">Fixture Works</bdi>"))
        << page.constData();
    EXPECT_TRUE(page.contains("<li>VST 3 <bdi>" + copy + "</bdi>: <bdi>not used, a copy of "))
        << page.constData();
}

TEST_F(Html, TheCatalogueAloneHasNoPicture)
{
    put("Comp.vst3");
    scan();
    const QByteArray page = run({"--list", "--format", "html"}).standardOutput;
    EXPECT_TRUE(page.contains("<bdi>Comp</bdi>")) << page.constData();
    EXPECT_FALSE(page.contains("class=\"timeline\""));
    EXPECT_EQ(run({"--list", "--html", m_folder.path("nowhere/page.html")}).exitCode, 2);
    EXPECT_EQ(run({"--list", "--html", m_folder.plugins()}).exitCode, 2);
}
