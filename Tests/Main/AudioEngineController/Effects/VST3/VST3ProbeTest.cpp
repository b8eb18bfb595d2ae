#include "Main/AudioEngineController/Effects/VST3/VST3Probe.h"
#include "Tests/Support/PluginBench.h"
#include "Tests/Support/VST3Fixture.h"

namespace {

class VST3ProbeTest : public PluginBench {
protected:
    ProbeOutcome probe(const QString &name, const QByteArray &script,
                       VST3Fixture fixture = VST3Fixture::Scripted)
    {
        return PluginBench::probe(VST3Probe(),
                                  addVST3File(m_folder.plugins(), name, tracing() + script + '\n', fixture));
    }
};

} // namespace

TEST_F(VST3ProbeTest, OutcomesAndWhatTheObserverHears)
{
    // Name, script, what the observer hears, and the classes listed, or what becomes of the catalogue; and
    // the reason.
    const char *const rows = R"(
six ~ class 1 / class 2 / class 3 / class 4 / class 5 / class 6 ~ load start ask 1 2 3 4 5 6 close ~ 1 2 3 4 5 6:
seven are announced ~ class A / answer count-classes 7 ~ load start ask A ! close ~ A:
a name twice ~ class A / class A / class C ~ load start ask A C close ~ A C:
a count too high ~ class A / answer count-classes 2147483647 ~ load start ask A ! close ~ A:
a negative count ~ answer count-classes -5 ~ load start ask close ~ record: its factory lists no classes
not initialised ~ class A / class B / answer initialize false A ~ load start ask A B close ~ B: its class "A" could not be initialised (result 0x00000001)
not created ~ class A / answer create-instance null ~ load start ask A close ~ record: its class "A" could not be created (result 0x00000000)
controller ~ class 1 / category "Component Controller Class" ~ load start ask close ~ record: its only class is not an audio plug-in
other categories ~ class 2 / category "Audio Module" / class 3 / category "Audio Module Class and 32 bytes!!" ~ load start ask close ~ record: none of its 2 classes is an audio plug-in
throws in the middle ~ class A / class B / class C / fault bus-count throw-std B ~ load start ask A B close ~ A: it threw: thrown by the fixture
throws no exception ~ fault count-classes throw-int ~ load start ask close ~ record: it threw something other than a standard exception
throws while closed ~ class A / fault factory-release throw-int / fault module-exit throw-std ~ load start ask A close ~ A:
does not start ~ answer module-entry false ~ load start close ~ record: its entry function reports that it could not start
throws at its start ~ fault module-entry throw-std ~ load start close ~ record: it threw: thrown by the fixture
WaveShell ~ ~ load start ask close ~ keep: its factory lists no classes
WaveShell without factory ~ answer get-factory null ~ load start ask close ~ keep: GetPluginFactory returned null
factory throws ~ fault get-factory throw-std ~ load start ask close ~ keep: it threw: thrown by the fixture
another factory ~ generation 0 ~ load start ask close ~ keep: its factory does not offer IPluginFactory
no export ~ ~ load start ask close ~ keep: it does not export GetPluginFactory
leaves a thread ~ class A / effect initialize thread ~ load start ask A close ~ A left threads:
)";
    for (const QStringList &row : rowsOf(rows)) {
        SCOPED_TRACE(row[0].toStdString());
        const bool isPlugin = row[0] != "no export";
        const ProbeOutcome outcome =
            probe(row[0], scriptIn(row[1]), isPlugin ? VST3Fixture::Scripted : VST3Fixture::NoEntry);
        expectOutcome(outcome, row, ".vst3");
    }
}

TEST_F(VST3ProbeTest, AClassIsWhatItsFormsAndBusesSay)
{
    // Script, and name, vendor and sub-categories, and the channels where they are not two and two. In the
    // older forms the byte E9 is no UTF-8; in UTF-16 it is a letter.
    const char *const rows = R"(
$ ~ A�|V�|Fx|EQ
$ / answer class-info2 false ~ A�|Fixture Works|
$ / answer class-info false ~ Aé|Vé|Fx|EQ
$ / answer class-info false / answer class-info2 false ~ Aé|Vé|Fx|EQ
$ / answer class-info false / answer class-info-unicode false ~ A�|V�|Fx|EQ
$ / answer class-info false / answer class-info2 false / answer class-info-unicode false ~
$ / answer class-info blank / answer class-info2 blank ~ Aé|Vé|Fx|EQ
$ / answer class-info false / generation 2 ~ A�|V�|Fx|EQ
$ / answer class-info false / generation 1 ~
$ / answer class-info false / category Audio ~
generation 1 / class A / vendor Unasked ~ A|Fixture Works|
factory-vendor "" / class A ~ A||Fx
class A / answer factory-info false ~ A||Fx
class "" ~ |Fixture Works|Fx
class "🎛 リバーブ" ~ 🎛 リバーブ|Fixture Works|Fx
class * / vendor * / subcategories ** ~ *|*|**
class A / inputs 1 / outputs ~ A|Fixture Works|Fx 1>0
class A / inputs 1:aux 2 6 2:aux ~ A|Fixture Works|Fx 8>2
class A / inputs 2:aux 1:aux / outputs 2:7 3:-1 ~ A|Fixture Works|Fx 3>5
class A / inputs 0 2:aux ~ A|Fixture Works|Fx 0>2
class A / inputs / outputs ~ A|Fixture Works|Fx
class A / subcategories "Fx|EQ| Synth" / inputs / outputs ~ A|Fixture Works|Fx|EQ| Synth 0>2
class A / inputs -5 2 / outputs -2147483648 ~ A|Fixture Works|Fx 2>0
class A / inputs 2147483647 2147483647 2 ~ A|Fixture Works|Fx 2147483647>2
class A / stated-inputs 2147483647 / stated-outputs -2147483648 ~ A|Fixture Works|Fx 2>0
class A / inputs 6 / outputs 6 / answer bus-info internal-error ~ A|Fixture Works|Fx
)";
    for (const QStringList &row : rowsOf(QByteArray(rows).replace('*', QByteArray(64, 'n')))) {
        QString script = row[0];
        script.replace('$', "class \"A\\xE9\" / vendor \"V\\xE9\" / subcategories Fx|EQ");
        QStringList found;
        for (const EffectRecord &record : probe("Forms", scriptIn(script)).records)
            found << record.name + '|' + record.vendor + '|' + record.categories +
                         QStringLiteral(" %1>%2").arg(record.inputs).arg(record.outputs).remove(" 2>2");
        EXPECT_EQ(found.join(' '), row[1]) << qPrintable(script);
    }
}

TEST_F(VST3ProbeTest, CallsComeInThisOrder)
{
    const struct {
        const char *name, *script, *entry, *exit, *information;
        VST3Fixture fixture;
    } rows[] = {
        {"oldest factory", "generation 1\n", "module-entry; ", "; module-exit", "", VST3Fixture::Scripted},
        {"older factory", "generation 2\n", "module-entry; ", "; module-exit", "class-info2 %1; ",
         VST3Fixture::Scripted},
        {"no entry and exit", "", "", "", "class-info2 %1; class-info-unicode %1; ", VST3Fixture::Plain}};
    for (const auto &row : rows) {
        probe(row.name, QByteArray("class A\nclass B\nclass A\n") + row.script, row.fixture);
        const QString ofClass =
            QLatin1String("class-info %1; ") + row.information +
            "create-instance %1; initialize %1; bus-count %1: input; bus-info %1: input 0; "
            "bus-count %1: output; bus-info %1: output 0; terminate %1; release %1; ";
        EXPECT_EQ(takeTrace(), QLatin1String("static-constructor; ") + row.entry +
                                   "get-factory; factory-info; count-classes; " + ofClass.arg("A") +
                                   ofClass.arg("B") + "class-info A; factory-release" + row.exit +
                                   "; static-destructor");
    }
}
