#include "Main/AudioEngineController/Effects/Protocol/ScanLock.h"
#include "Tests/Scanner/InterruptedScan.h"

#include <csignal>

#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

TEST_F(InterruptedScan, ASignalThatTheStarterIgnoresIsIgnored)
{
    update("delay initialize 300\n");
    ScannerRun scanner("/bin/sh", m_folder);
    scanner.setArguments(
        {"-c", "trap '' HUP INT; exec \"$0\" \"$1\"", scannerProgram(), m_folder.scanList()});
    EXPECT_TRUE(interrupt(scanner, {{"SIGHUP", SIGHUP}, {"SIGINT", SIGINT}}).succeeded());
    EXPECT_EQ(renewed(), m_names);
}

TEST_F(InterruptedScan, AReaderThatGoesAwayDoesNotEndTheScan)
{
    update("effect initialize print 200\n");
    ScannerRun scanner("/bin/sh", m_folder);
    scanner.setArguments({"-c", "{ \"$0\" \"$1\" 2>&1; echo $? > \"$2\"; } | head -c 1", scannerProgram(),
                          m_folder.scanList(), m_folder.path("status")});
    scanner.removeEnvironment("FXPROBE_LOG");
    EXPECT_TRUE(scanner.run().succeeded());
    EXPECT_EQ(m_folder.read("status"), "0\n");
    EXPECT_EQ(renewed(), m_names);
}

TEST_F(InterruptedScan, ALockOfADeadScannerThatNobodyCanTakeAwayKeepsNobodyAway)
{
    update({});
    int lifeline[2];
    ASSERT_EQ(pipe(lifeline), 0);
    const pid_t scanner = fork();
    if (scanner == 0) {
        const ScanLock lock(m_folder.effects());
        char byte = 0;
        if (fork() == 0) { // as a plug-in may, in whose child the lock lives on
            close(lifeline[1]);
            static_cast<void>(read(lifeline[0], &byte, 1) == 0);
        }
        _exit(0);
    }
    ASSERT_EQ(waitpid(scanner, nullptr, 0), scanner);
    EXPECT_FALSE(ScanLock::isScannerAtWork(m_folder.effects()));
    scan();
    EXPECT_EQ(renewed(), m_names);
    close(lifeline[0]);
    close(lifeline[1]);
}

TEST_F(InterruptedScan, APipeIsWaitedForNowhere)
{
    update({});
    for (const char *pipe : {"Plugins/Pipe.vst3", "Plugins/Pipe.so", "Effects/FXConfiguration.xml",
                             "Effects/Pipe.scan3", "Effects/Pipe.scan"}) {
        ::unlink(m_folder.path(pipe).toUtf8().constData());
        ASSERT_EQ(mkfifo(m_folder.path(pipe).toUtf8().constData(), 0600), 0) << pipe;
    }
    EXPECT_TRUE(scanOnce().succeeded());
    EXPECT_EQ(renewed(), m_names);
}
