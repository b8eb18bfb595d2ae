#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"
#include "Tests/Scanner/ScanTable.h"
#include "Workstation/Options/PluginFolders.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

// What fxscan remembers of folders, with the steps of ScanTable and these:
//   fxscan CODE ARGUMENT…: TEXT | …   ends with that code; the texts are parts of what it prints
//   shows ARGUMENT…: NAME STATE, …    a scan that prints these plug-ins
//   listed: FOLDER…                   what the scan list names
//   usual FOLDER…                     the only usual folders that there are: the first of VST 3,
//                                     the others of CLAP; "." none
//   fresh FOLDER                      another data folder, which must not be there yet

namespace {

const char kSteps[] = R"(
= Folders are remembered and a scan of one shows what lies below it
put a/One.vst3, b/Two.vst3, c/Echo.vst2:
usual .
remove Effects/FXScan.xml
shows @/Plugins/a: One ok
shows @/Plugins/b/Two.vst3 @/Plugins/c: Two ok, Echo ok
listed: @/Plugins/a @/Plugins/b/Two.vst3 @/Plugins/c
new a/One.vst3, b/Two.vst3:
put b/New.vst3: class New | answer initialize false
mark Echo Favourite 1
shows @/Plugins/b: Two ok, New failed
loaded Two New
listed: @/Plugins/a @/Plugins/b/Two.vst3 @/Plugins/c @/Plugins/b
usual @/Plugins/d @/Plugins/e
put d/Usual.vst3, e/Late.clap:
shows : One ok, Two ok, New failed, Usual ok, Echo ok, Late ok
loaded One Usual Late
listed: @/Plugins/a @/Plugins/b/Two.vst3 @/Plugins/c @/Plugins/b @/Plugins/d @/Plugins/e
usual .
fxscan 0 --folders: @/Plugins/a\t1\t\n@/Plugins/b/Two.vst3\t1\t\n@/Plugins/c\t1\t\n@/Plugins/b\t2\t\n@/Plugins/d\t1
vst2 Name Favourite: Echo|1
put e/Copy.vst3: class One
fxscan 0 @/Plugins/e: not used  VST 3  @/Plugins/e/Copy.vst3: a copy of @/Plugins/a/One.vst3

= A scan of one folder follows the links in it
put a/Own.vst3, drive/Two.vst3, drive/deep/Three.clap, other/Four.clap:
move Plugins/drive Drive
move Plugins/other Other
link Plugins/a/drive Drive
link Plugins/a/Four.clap Other/Four.clap
usual .
fxscan 0 --exclude @/Drive/deep: is not searched any more
shows @/Plugins/a: Own ok, Two ok, Four ok
shows @/Plugins/a/drive: Two ok

= A link to another remembered folder is followed
put a/One.vst3, b/Two.vst3, b/sub/Four.vst3:
link Plugins/a/inner Plugins/b
link Plugins/a/lower Plugins/b/sub
usual .
shows @/Plugins/a @/Plugins/b: One ok, Two ok, Four ok
new b/Two.vst3:
put b/Three.vst3:
shows @/Plugins/a: One ok, Three ok
loaded Two Three
shows : One ok, Two ok, Three ok, Four ok
loaded .

= A folder whose name holds what separates paths is searched alone
put a/One.vst3, b/Two.vst3:
move Plugins/b Plugins/x~y
usual .
shows @/Plugins/a: One ok
new a/One.vst3:
shows @/Plugins/x~y: Two ok
loaded Two

= What moved from one folder to another is shown where it was and where it is
put a/One.vst3, a/Comp.vst3, b/Two.vst3:
usual .
shows @/Plugins/a @/Plugins/b: One ok, Comp ok, Two ok
mark Comp Favourite 1
move Plugins/a/Comp.vst3 Plugins/b/Comp.vst3
fxscan 0 @/Plugins/a: 1 usable, 1 file gone\n | Comp (VST 3, file gone): its file is not there
shows @/Plugins/b: Comp ok, Two ok
remove Plugins/b/Two.vst3
fxscan 0 @/Plugins/b: 1 usable; 1 gone: Two\n

= A folder of the environment that is not there is named
usual @/nowhere
put One.vst3:
fxscan 0 --folders: left out: there is no folder '@/nowhere' | @/Plugins\t0\t\n
shows : One ok

= What is away is kept until its folder is forgotten
put a/One.vst3, drive/Two.vst3:
usual .
remove Effects/FXScan.xml
shows @/Plugins/a @/Plugins/drive: One ok, Two ok
move Plugins/drive unplugged
shows : One ok, Two folder away
fxscan 0 : Problem: @/Plugins/drive could not be searched: it does not exist.
fxscan 2 @/Plugins/drive: there is no folder
fxscan 0 --forget @/Plugins/drive: 1 plug-in dropped
listed: @/Plugins/a
shows : One ok
fxscan 2 --forget @/Plugins/drive: nothing is remembered of
put a/deep/Three.vst3:
shows @/Plugins/a: One ok, Three ok
fxscan 0 --forget @/Plugins/a/deep: 1 plug-in dropped | The next scan searches @/Plugins/a/deep again
listed: @/Plugins/a

= A module that is gone is let go, and one that cannot be listed is named
put a/One.vst3, a/Two.vst3, b/x&lt;.vst3:
usual .
remove Effects/FXScan.xml
shows @/Plugins/a/One.vst3 @/Plugins/a: One ok, Two ok
remove Plugins/a/One.vst3
fxscan 0 : 1 gone: One
shows : Two ok
listed: @/Plugins/a
fxscan 2 @/Plugins/a/One.vst3: there is no folder or plug-in '@/Plugins/a/One.vst3'
fxscan 2 @/Plugins/b/x&lt;.vst3: the name of '@/Plugins/b/x&lt;.vst3' cannot stand in a scan list

= An excluded folder is dropped and comes back on request
put a/One.vst3, a/b/Two.vst3:
usual .
shows @/Plugins/a: One ok, Two ok
fxscan 0 --exclude @/Plugins/a/b: is not searched any more; 1 plug-in dropped
shows : One ok
fxscan 2 @/Plugins/a/b: is excluded; --no-exclude takes that back
fxscan 2 --no-exclude @/Plugins/a: '@/Plugins/a' is not excluded
fxscan 2 --no-exclude @/Plugins/a/b/Two.vst3: is excluded with '@/Plugins/a/b'
fxscan 0 --no-exclude @/Plugins/a/b: is not excluded any more
shows @/Plugins: One ok, Two ok

= What is ignored is shown and neither loaded nor offered
put One.vst3: class A | class B
put Two.vst3: fault initialize kill
usual .
shows @/Plugins: A ok, B ok, Two disabled
mark A Favourite 1, B Enabled 0
fxscan 0 --ignore @/Plugins/One.vst3 --ignore @/Plugins/Two.vst3: One.vst3 is not loaded any more (2 plug-ins)
vst3 Name Enabled Working: A|0|0, B|0|1, Two|0|0
new One.vst3: class A | class B | class C
new Two.vst3:
shows @/Plugins: A ignored, B ignored, Two ignored
loaded .
fxscan 0 --list: 3 plug-ins: 3 ignored
fxscan 0 --retry-failed: 3 ignored
fxscan 2 --retry A: 'A' is ignored; --no-ignore its path first
fxscan 2 --rescan A: 'A' is ignored; --no-ignore its path first
loaded .
fxscan 0 --favourite Two --no-ignore @/Plugins/One.vst3: is not ignored any more
fxscan 0 --list: 3 plug-ins: 1 switched off, 1 ignored, 1 not asked
shows @/Plugins: A ok, B switched off, C ok, Two ignored
loaded One
vst3 Name Favourite: A|1, B|0, C|0, Two|1
fxscan 2 --no-ignore @/Plugins/One.vst3: is not ignored
fxscan 2 --ignore @/Plugins/None.vst3: there is no plug-in or folder

= A damaged memory is named and costs nothing
put One.vst3:
usual .
shows @/Plugins: One ok
write Effects/FXFolders.json: {"version":1,"ignored":[
fxscan 3 @/Plugins: FXFolders.json cannot be used, so nothing is scanned
fxscan 3 --ignore @/Plugins: FXFolders.json cannot be used, so nothing is changed
fxscan 0 --list: One | FXFolders.json cannot be used
holds Effects/FXFolders.json: {"version":1,"ignored":[
usual .
write Effects/FXScan.xml: <Scan>\n\t<Path>/
fxscan 3 @/Plugins: FXScan.xml cannot be used, so nothing is scanned
fxscan 3 --forget @/Plugins: FXScan.xml cannot be used, so nothing is changed

= What makes no sense leaves no data folder behind
put One.vst3:
write a.txt: x
fresh new/data
fxscan 2 --retry Nobody @/Plugins: no disabled or failed plug-in is named 'Nobody'
fxscan 2 @/a.txt: is neither a folder nor a plug-in
fxscan 2 --no-ignore @/Plugins: is not ignored
fxscan 2 --forget @/Plugins: nothing is remembered of
fxscan 2 --folders --ignore @/Plugins: stands alone
fresh new/data
)";

class Folders : public ScanTable {
protected:
    void carryOut(const QString &step) override
    {
        const QString head = resolved(step.section(':', 0, 0));
        const QString text = resolved(step.section(':', 1)).trimmed();
        const QStringList words = head.split(' ', Qt::SkipEmptyParts);
        if (words[0] == "fxscan") {
            const ScannerOutcome outcome = run(words.mid(2));
            const QByteArray output = outcome.standardOutput + outcome.standardError;
            EXPECT_EQ(outcome.exitCode, words[1].toInt()) << output.constData();
            for (const QString &part : text.split(" | "))
                EXPECT_TRUE(QString(output).contains(QString(part).replace("\\n", "\n").replace("\\t", "\t")))
                    << output.constData();
        } else if (words[0] == "shows") {
            forgetTrace();
            const ScannerOutcome outcome = run(QStringList{"--jobs", "1", "--format", "json"} + words.mid(1));
            EXPECT_EQ(outcome.exitCode, 0) << outcome.standardError.constData();
            EXPECT_EQ(shown(outcome.standardOutput), sorted(text.split(", ")));
        } else if (words[0] == "listed") {
            EXPECT_EQ(ReadScanList(m_folder.scanList()).folders.join(' '), text);
        } else if (words[0] == "usual") {
            // Those of this machine are left out.
            FolderRules rules;
            rules.excluded = platformPluginFolders();
            EXPECT_TRUE(writeFolderRules(m_folder.effects(), rules));
            m_usual = words.value(1) == "." ? QStringList() : words.mid(1);
        } else if (words[0] == "fresh") {
            m_dataFolder = m_folder.path(words[1]);
            EXPECT_FALSE(QFileInfo::exists(m_folder.path(words[1].section('/', 0, 0))));
        } else {
            ScanTable::carryOut(step);
        }
    }

private:
    ScannerOutcome run(const QStringList &arguments)
    {
        ScannerRun fxscan(QStringLiteral(FXPROBE_FXSCAN), m_folder);
        fxscan.removeEnvironment("FXPROBE_LOG");
        fxscan.setEnvironment("VST3_PATH", m_usual.value(0));
        fxscan.setEnvironment("CLAP_PATH", m_usual.mid(1).join(QDir::listSeparator()));
        fxscan.setArguments(QStringList{"--quiet", "--data-folder", m_dataFolder} + arguments);
        return fxscan.run();
    }
    static QStringList sorted(QStringList list)
    {
        list.sort();
        return list;
    }
    static QStringList shown(const QByteArray &json)
    {
        QStringList plugins;
        for (const QJsonValue plugin : QJsonDocument::fromJson(json).object()["plugins"].toArray())
            plugins.append(plugin["name"].toString() + ' ' + plugin["state"].toString());
        return sorted(plugins);
    }

    QString m_dataFolder = m_folder.dataFolder();
    QStringList m_usual;
};

} // namespace

TEST_P(Folders, AreRemembered) { carryOutAll(); }

INSTANTIATE_TEST_SUITE_P(Of, Folders, testing::ValuesIn(scanCases(kSteps)), nameOfScan);
