#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

namespace {

using VST3CallOrder = VST3ScanBench;

} // namespace

TEST_F(VST3CallOrder, OfAHealthyProbe)
{
    const struct {
        const char *name;
        VST3Fixture fixture;
        QByteArray script;
        const char *entry, *exit, *information;
    } rows[] = {{"Factory1", VST3Fixture::Scripted, "generation 1\n", "module-entry; ", "; module-exit", ""},
                {"Factory2", VST3Fixture::Scripted, "generation 2\n", "module-entry; ", "; module-exit",
                 "class-info2 %1; "},
                {"Factory3", VST3Fixture::Scripted, "", "module-entry; ", "; module-exit",
                 "class-info2 %1; class-info-unicode %1; "},
                {"Without entry and exit", VST3Fixture::Plain, "", "", "",
                 "class-info2 %1; class-info-unicode %1; "}};
    for (const auto &row : rows)
        add(row.name, row.script + "class \"A " + row.name + "\"\nclass \"B " + row.name + "\"\n",
            row.fixture);
    scan();
    for (const auto &row : rows) {
        const QString ofClass =
            QLatin1String("class-info %1; ") + row.information +
            "create-instance %1; initialize %1; bus-count %1: input; bus-info %1: input 0; "
            "bus-count %1: output; bus-info %1: output 0; terminate %1; release %1; ";
        const QString name = row.name;
        EXPECT_EQ(traceOf(name).join("; "), QLatin1String("static-constructor; ") + row.entry +
                                                "get-factory; factory-info; count-classes; " +
                                                ofClass.arg("A " + name) + ofClass.arg("B " + name) +
                                                "factory-release" + row.exit + "; static-destructor");
    }
}
