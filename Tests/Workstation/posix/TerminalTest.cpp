#include "Tests/Workstation/FxScanBench.h"

#include <QDeadlineTimer>
#include <QFile>
#include <QRegularExpression>
#include <QThread>

#include <array>
#include <csignal>
#include <vector>

#include <poll.h>
#include <pty.h>
#include <sys/wait.h>
#include <termios.h>
#include <unistd.h>

namespace {

/// fxscan on a terminal of 70 columns, with a user at its keys.
class FxScanOnTerminal : public ScanBench {
protected:
    /// Runs it, after the words of another program that starts it; `key` is pressed when `at` has been shown.
    /// Gives the exit code.
    int run(const QByteArray &at, char key, const QByteArray &option = "--timeout=60",
            QList<QByteArray> words = {})
    {
        words += {FXPROBE_FXSCAN, "--data-folder", m_folder.dataFolder().toUtf8(), option,
                  m_folder.plugins().toUtf8()};
        std::vector<char *> arguments;
        for (QByteArray &word : words)
            arguments.push_back(word.data());
        arguments.push_back(nullptr);
        winsize size = {24, 70, 0, 0};
        int terminal = -1;
        const pid_t child = forkpty(&terminal, nullptr, nullptr, &size);
        if (child == 0) {
            execvp(arguments[0], arguments.data());
            _exit(127);
        }
        m_shown.clear();
        const QDeadlineTimer deadline(30000);
        bool isPressed = false;
        while (child > 0 && readSome(terminal) && !deadline.hasExpired())
            if (!isPressed && m_shown.contains(at))
                isPressed = write(terminal, &key, 1) == 1;
        EXPECT_TRUE(isPressed) << m_shown.constData();
        EXPECT_TRUE(isAsItWas(terminal)) << m_shown.constData();
        close(terminal);
        int status = -1;
        waitpid(child, &status, 0);
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }
    /// What stands on the terminal in the end, without what was taken away again.
    QString remains() const
    {
        return QString::fromUtf8(m_shown).remove('\r').remove(QRegularExpression("[^\n]*\x1b\\[K"));
    }

    QByteArray m_shown;

private:
    static bool isAsItWas(int terminal)
    {
        constexpr tcflag_t kUsual = ICANON | ECHO;
        termios mode = {};
        return tcgetattr(terminal, &mode) == 0 && (mode.c_lflag & kUsual) == kUsual;
    }
    /// False when nobody has the terminal any more.
    bool readSome(int terminal)
    {
        constexpr int kLook = 100; // ms
        pollfd output = {terminal, POLLIN, 0};
        if (poll(&output, 1, kLook) == 0)
            return true;
        std::array<char, 4096> buffer;
        const ssize_t read = ::read(terminal, buffer.data(), buffer.size());
        m_shown.append(buffer.data(), static_cast<int>(std::max<ssize_t>(read, 0)));
        return read > 0;
    }
};

} // namespace

TEST_F(FxScanOnTerminal, ShowsALiveLineAndListensToKeys)
{
    put("Good.vst3");
    put("Hang.vst3", "fault initialize hang\n");
    EXPECT_EQ(run("(2 s of 60; s skips it, q cancels)", 'S'), 0);
    EXPECT_TRUE(remains().startsWith("Skipping " + m_folder.plugins() + "/Hang.vst3\nFORMAT  NAME"))
        << qPrintable(remains());
    EXPECT_TRUE(remains().endsWith("1 usable; 1 new, 1 skipped: Hang.vst3\n")) << qPrintable(remains());

    EXPECT_EQ(run("] VST 3  Hang.vst3", 'q'), 3);
    EXPECT_TRUE(remains().startsWith("Cancelling\nfxscan: the scan was cancelled; what was found until then "
                                     "is kept\nFORMAT"))
        << qPrintable(remains());
    EXPECT_EQ(recordsOf("VST3Configuration.xml", "Name Enabled Working"), QStringList("Good|1|1"));

    dateLater(put("Good.vst3", "class Good\nfault initialize hang\n"));
    QFile::remove(m_folder.path("Plugins/Hang.vst3"));
    EXPECT_EQ(run("(2 s of 60; s", 's'), 0);
    EXPECT_TRUE(remains().endsWith("\n1 plug-in: 1 usable; 1 skipped: Good.vst3\n")) << qPrintable(remains());
    EXPECT_EQ(m_folder.markers(), QStringList());
}

TEST_F(FxScanOnTerminal, SaysInWhichFolderItWaits)
{
    const QByteArray folder = QFileInfo(put("s/Plug.vst3")).path().toUtf8();
    const QList<QByteArray> strace{"strace", "-f",
                                   "-o",     m_folder.path("operations").toUtf8(),
                                   "-e",     "inject=getdents64:delay_enter=2000000:when=1",
                                   "-P",     folder};
    qputenv("ASAN_OPTIONS", "detect_leaks=0"); // not when traced
    EXPECT_EQ(run("/s (", ' ', "--timeout=60", strace), 0);
    EXPECT_TRUE(m_shown.contains("\rLooking in ") || m_shown.contains("KLooking in ")) << m_shown.constData();
    EXPECT_TRUE(m_shown.contains(" s of 60)")) << m_shown.constData();
    EXPECT_TRUE(remains().startsWith("FORMAT")) << qPrintable(remains());
}

TEST_F(FxScanBench, AScanThatIsCancelledInItsScannerSaysSo)
{
    ASSERT_TRUE(startHanging("fault initialize hang\n"));
    for (const qint64 scanner : m_fxscan.children())
        kill(static_cast<pid_t>(scanner), SIGTERM);
    const ScannerOutcome &outcome = m_fxscan.wait();
    EXPECT_EQ(outcome.exitCode, 3);
    EXPECT_TRUE(outcome.standardError.contains("the scan was cancelled"))
        << outcome.standardError.constData();
}

TEST_F(FxScanOnTerminal, IsPutBackHoweverTheScanEnds)
{
    put("Plug.vst3", "delay initialize 300\nfault initialize abort\n");
    EXPECT_EQ(run("] VST 3  Plug.vst3", 'x', "--in-process"), -1);
    QFile::remove(m_folder.path("Effects/Plug.scan3"));
    put("Plug.vst3", "fault initialize hang\n");
    constexpr char kInterrupt = '\x03';
    EXPECT_EQ(run("(2 s)", kInterrupt, "--in-process"), 3);
    EXPECT_TRUE(remains().endsWith("fxscan: the scan was cancelled, and a plug-in did not return\n"))
        << qPrintable(remains());
    constexpr char kQuit = '\x1c';
    EXPECT_EQ(run("(2 s of 60; s", kQuit), -1);
    const QDeadlineTimer deadline(30000); // the scanner finds itself alone
    while (!m_folder.read("FxProbe.report").contains("\"ended\"") && !deadline.hasExpired())
        QThread::msleep(10);
    EXPECT_EQ(m_folder.markers(), QStringList());
}
