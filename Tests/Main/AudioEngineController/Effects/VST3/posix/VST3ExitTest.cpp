#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

namespace {

using VST3Exit = VST3ScanBench;

} // namespace

TEST_F(VST3Exit, OfAPluginRunsNobodysExitHandlers)
{
    add("Comp", "class Comp\nfault initialize exit\n");
    EXPECT_EQ(scanOnce().exitCode, 0);
    EXPECT_EQ(traceOf("Comp").last(), "initialize Comp");
}
