#include "Main/AudioEngineController/Effects/CLAP/CLAPProbe.h"
#include "Tests/Support/CLAPFixture.h"
#include "Tests/Support/PluginBench.h"

namespace {

class CLAPProbeTest : public PluginBench {
protected:
    ProbeOutcome probe(const QString &name, const QByteArray &script)
    {
        return PluginBench::probe(CLAPProbe(), addCLAPFile(m_folder.plugins(), name, tracing() + script));
    }
};

} // namespace

TEST_F(CLAPProbeTest, OutcomesAndWhatTheObserverHears)
{
    // Name, script, what the observer hears, and the plug-ins listed, or what becomes of the catalogue; and
    // the reason.
    const char *const rows = R"(
six ~ class 1 / class 2 / class 3 / class 4 / class 5 / class 6 ~ load start ask 1 2 3 4 5 6 close ~ 1 2 3 4 5 6:
seven are announced ~ class A / class A / answer plugin-count 7 ~ load start ask A ! close ~ A:
a count too high ~ class A / answer plugin-count -1 ~ load start ask A ! close ~ A:
none ~ answer plugin-count 0 ~ load start ask close ~ record: its factory lists no plug-ins
no descriptor ~ class A / class B / answer descriptor null A ~ load start ask B close ~ B:
older descriptor ~ class A / older ~ load start ask close ~ record: none of its plug-ins has a descriptor that can be used
no identifier ~ class A / null id / class B ~ load start ask B close ~ B: its plug-in "A" has no identifier
not created ~ class A / class B / answer create-plugin null A ~ load start ask A B close ~ B: its plug-in "A" could not be created
not initialised ~ class A / answer init false ~ load start ask A close ~ record: its plug-in "A" could not be initialised
without init ~ class A / null init ~ load start ask A close ~ record: its plug-in "A" lacks a function
without destroy ~ class A / null destroy ~ load start ask A close ~ record: its plug-in "A" lacks a function
without extensions ~ class A / null get-extension ~ load start ask A close ~ record: its plug-in "A" lacks a function
older entry ~ older / class A ~ load close ~ record: it is built for version 0.25 of CLAP, which came before the first stable one
without entry functions ~ null entry-init ~ load close ~ record: its clap_entry lacks a function
without deinit ~ null entry-deinit ~ load close ~ record: its clap_entry lacks a function
without get_factory ~ null get-factory ~ load close ~ record: its clap_entry lacks a function
does not start ~ answer entry-init false ~ load start close ~ record: its init function reports that it could not start
throws at its start ~ fault entry-init throw-null ~ load start close ~ record: it threw an exception without a text
without a factory ~ answer get-factory null ~ load start ask close ~ keep: it has no plug-in factory
a factory without functions ~ null create-plugin ~ load start ask close ~ keep: its plug-in factory lacks a function
factory throws ~ fault get-factory throw-std ~ load start ask close ~ keep: it threw: thrown by the fixture
throws in the middle ~ class A / class B / class C / fault port-count throw-std B ~ load start ask A B close ~ A: it threw: thrown by the fixture
throws while closed ~ class A / fault entry-deinit throw-std ~ load start ask A close ~ A:
leaves a thread ~ class A / effect init thread ~ load start ask A close ~ A left threads:
)";
    for (const QStringList &row : rowsOf(rows)) {
        SCOPED_TRACE(row[0].toStdString());
        expectOutcome(probe(row[0], scriptIn(row[1])), row, ".clap");
    }
}

TEST_F(CLAPProbeTest, APluginIsWhatItsDescriptorAndPortsSay)
{
    // Script, and identifier, vendor, version and features, and the channels where they are not two and two.
    // The byte E9 is no UTF-8.
    const char *const rows = R"(
class A ~ A|fixture.A|Fixture Works|1.0|audio-effect
class A / id com.a.B / vendor "V\xE9" / version 2 / features instrument "a|b" ~ A|com.a.B|V�|2|instrument|a/b
class A / null name vendor version features ~ fixture.A|fixture.A|||
class A / vendor "" / version "" / features ~ A|fixture.A|||
class "🎛" / id * ~ 🎛|+|Fixture Works|1.0|audio-effect
class A / features * reverb ~ A|fixture.A|Fixture Works|1.0|+
class A / inputs 1 / outputs ~ A|fixture.A|Fixture Works|1.0|audio-effect 1>0
class A / inputs 1:aux 2 6 2:aux ~ A|fixture.A|Fixture Works|1.0|audio-effect 8>2
class A / inputs 2:aux 1:aux / outputs -1 -1 ~ A|fixture.A|Fixture Works|1.0|audio-effect 3>2147483647
class A / stated-inputs -1 / stated-outputs 0 ~ A|fixture.A|Fixture Works|1.0|audio-effect 2>0
class A / answer port-info false ~ A|fixture.A|Fixture Works|1.0|audio-effect 0>0
class A / answer get-extension null ~ A|fixture.A|Fixture Works|1.0|audio-effect 0>0
null port-count / class A ~ A|fixture.A|Fixture Works|1.0|audio-effect 0>0
null port-info / class A ~ A|fixture.A|Fixture Works|1.0|audio-effect 0>0
)";
    // An identifier is cut after 4,096 bytes.
    const QString table =
        QString::fromUtf8(rows).replace('*', QString(5000, 'n')).replace('+', QString(4096, 'n'));
    for (const QStringList &row : rowsOf(table.toUtf8())) {
        QStringList found;
        for (const EffectRecord &record : probe("Parts", scriptIn(row[0])).records)
            found << QStringList({record.name, record.id, record.vendor, record.version, record.categories})
                             .join('|') +
                         QStringLiteral(" %1>%2").arg(record.inputs).arg(record.outputs).remove(" 2>2");
        EXPECT_EQ(found.join(' '), row[1]) << qPrintable(row[0].left(100));
    }
}

TEST_F(CLAPProbeTest, CallsComeInThisOrderAndTheHostOffersLogAndThreadCheck)
{
    probe("Order", "class A\nclass B\nask-host init \"to say\"\n");
    QString ofPlugin = "create-plugin %1; init %1; host %1: main other; get-extension %1: clap.audio-ports; "
                       "port-count %1: input; port-info %1: input 0; port-count %1: output; "
                       "port-info %1: output 0; destroy %1; ";
    EXPECT_EQ(takeTrace(), "static-constructor; entry-init; get-factory; plugin-count; descriptor A; " +
                               ofPlugin.arg("A") + "descriptor B; " + ofPlugin.arg("B") +
                               "entry-deinit; static-destructor");
    EXPECT_EQ(m_log.count("Order.clap says: to say"), 4);

    // A plug-in that goes on after its end finds its host, which does not log for ever.
    EXPECT_TRUE(probe("Later", "class A\nask-host destroy null for-ever\n").leftThreads);
    EXPECT_EQ(probe("Next", "class A\ndelay init 200\n").records.size(), 1u);
    EXPECT_LE(m_log.count("Later.clap says: "), 100);
}
