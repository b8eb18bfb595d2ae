#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

namespace {

using VST3Buses = VST3ScanBench;

} // namespace

// All in one run; "Outputs" carries the number of inputs.
TEST_F(VST3Buses, TheMainOnesGiveTheChannels)
{
    const struct {
        const char *name, *statements, *inputs;
    } cases[] = {
        {"mono in, no output", "inputs 1\noutputs\n", "1"},
        {"main buses add up, others do not count", "inputs 2 6 2:aux 1:aux\n", "8"},
        {"main after a side chain", "inputs 1:aux 4\n", "4"},
        {"none is main: all count", "inputs 2:aux 1:aux\n", "3"},
        {"types nobody knows are not main", "inputs 2:7 1:-1\n", "3"},
        {"a main bus without channels wins over a side chain", "inputs 0 2:aux\noutputs 2\n", "0"},
        {"no input, one output", "inputs\noutputs 2\n", "0"},
        {"no bus: an effect is taken for stereo", "inputs\noutputs\n", "2"},
        {"no bus: a synth has no input", "subcategories Fx|Synth\ninputs\noutputs\n", "0"},
        {"buses without channels count as none", "inputs 0\noutputs 0\n", "2"},
        {"a negative count is no channel", "inputs -5 2\n", "2"},
        {"only negative counts, both ways", "inputs -2147483648\noutputs -1\n", "2"},
        {"counts whose sum is too large", "inputs 2147483647 2147483647 2\n", "2147483647"},
        {"more buses stated than there are", "inputs 2\nstated-inputs 2147483647\n", "2"},
        {"fewer buses stated than there are", "inputs 2 2\nstated-inputs 1\n", "2"},
        {"a negative number of buses, both ways", "stated-inputs -1\nstated-outputs -2147483648\n", "2"},
        {"no bus tells about itself", "inputs 6\noutputs 6\nanswer bus-info internal-error\n", "2"},
    };
    for (const auto &row : cases)
        add(row.name, QByteArray("class \"") + row.name + "\"\n" + row.statements);
    scan();
    const QStringList found = records("Name Inputs Outputs Working");
    EXPECT_EQ(found.size(), static_cast<int>(std::size(cases)));
    for (const auto &row : cases) {
        const QString expected = QStringLiteral("%1|%2|%2|1").arg(row.name, row.inputs);
        EXPECT_TRUE(found.contains(expected)) << qPrintable(found.filter(row.name).join(' '));
    }
}
