#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

namespace {

class VST3CallOrder : public VST3ScanBench {
protected:
    static QStringList callsOfClass(const char *name, bool hasNewer, bool hasUnicode)
    {
        QStringList calls;
        for (const char *call :
             {"class-info %1", "class-info2 %1", "class-info-unicode %1", "create-instance %1",
              "initialize %1", "bus-count %1: input", "bus-info %1: input 0", "bus-count %1: output",
              "bus-info %1: output 0", "terminate %1", "release %1"}) {
            const QString text = QString::fromLatin1(call);
            if ((hasNewer || !text.startsWith(QLatin1String("class-info2"))) &&
                (hasUnicode || !text.startsWith(QLatin1String("class-info-unicode"))))
                calls.append(text.arg(QLatin1String(name)));
        }
        return calls;
    }
};

} // namespace

TEST_F(VST3CallOrder, AHealthyProbeCallsInThisOrder)
{
    const struct {
        const char *name;
        VST3Fixture fixture;
        const char *generation;
        bool hasNewer;
        bool hasUnicode;
    } cases[] = {{"Factory1", VST3Fixture::Scripted, "generation 1\n", false, false},
                 {"Factory2", VST3Fixture::Scripted, "generation 2\n", true, false},
                 {"Factory3", VST3Fixture::Scripted, "generation 3\n", true, true},
                 {"NoEntryFunctions", VST3Fixture::Plain, "", true, true}};
    for (const auto &row : cases)
        add(QString::fromLatin1(row.name),
            QByteArray(row.generation) + "class \"A " + row.name + "\"\nclass \"B " + row.name + "\"\n",
            row.fixture);
    scan();
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        const bool hasEntry = row.fixture == VST3Fixture::Scripted;
        QStringList expected = texts({"static-constructor"});
        if (hasEntry)
            expected += texts({"module-entry"});
        expected += texts({"get-factory", "factory-info", "count-classes"});
        for (const char *letter : {"A ", "B "})
            expected +=
                callsOfClass((QByteArray(letter) + row.name).constData(), row.hasNewer, row.hasUnicode);
        expected += texts({"factory-release"});
        if (hasEntry)
            expected += texts({"module-exit"});
        EXPECT_EQ(traceOf(QString::fromLatin1(row.name)), expected + texts({"static-destructor"}));
    }
}
