#include "Main/AudioEngineController/Effects/Protocol/ScanLock.h"
#include "Tests/Scanner/InterruptedProbe.h"

#include <csignal>

#include <sys/wait.h>
#include <unistd.h>

TEST_F(InterruptedProbe, ASignalThatTheStarterIgnoresIsIgnored)
{
    slowDown("delay initialize 300\n");
    ScannerRun scanner("/bin/sh", m_folder);
    scanner.setArguments(
        {"-c", "trap '' HUP INT; exec \"$0\" \"$1\"", scannerProgram(), m_folder.scanList()});
    EXPECT_TRUE(interrupt(scanner, {{"SIGHUP", SIGHUP}, {"SIGINT", SIGINT}}).succeeded());
    EXPECT_EQ(renewed(), kThree);
}

TEST_F(InterruptedProbe, AReaderThatGoesAwayDoesNotEndTheScan)
{
    slowDown("effect initialize print 200\n");
    ScannerRun scanner("/bin/sh", m_folder);
    scanner.setArguments({"-c", "{ \"$0\" \"$1\" 2>&1; echo $? > \"$2\"; } | head -c 1", scannerProgram(),
                          m_folder.scanList(), m_folder.path("status")});
    scanner.removeEnvironment("FXPROBE_LOG");
    EXPECT_TRUE(scanner.run().succeeded());
    EXPECT_EQ(m_folder.read("status"), "0\n");
    EXPECT_EQ(renewed(), kThree);
}

TEST_F(InterruptedProbe, ALockOfADeadScannerThatNobodyCanTakeAwayKeepsNobodyAway)
{
    slowDown({});
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
    EXPECT_TRUE(run().succeeded());
    EXPECT_EQ(renewed(), kThree);
    close(lifeline[0]);
    close(lifeline[1]);
}
