#include "Tests/Scanner/InterruptedProbe.h"

#include <csignal>

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
