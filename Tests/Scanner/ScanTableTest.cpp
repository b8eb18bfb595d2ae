#include "Tests/Scanner/ScanTable.h"

namespace {

const char kScans[] = R"(
= A catalogue that cannot be used is replaced
put Comp.vst3:
write Effects/VST3Configuration.xml:
scan
vst3 Name: Comp
write Effects/VST3Configuration.xml: not a catalogue\n
scan
loaded Comp
log: Cannot use the catalogue @/Effects/VST3Configuration.xml
write Effects/VST3Configuration.xml: <Scan></Scan>
scan
loaded Comp
cut Effects/VST3Configuration.xml: <Vendor>
scan
loaded Comp
vst3 Name Enabled: Comp|1
same

= What crashed is salvaged from a damaged catalogue
put Comp.vst3:
scan
mark Comp Enabled 0, Comp Working 0
cut Effects/VST3Configuration.xml: </Effects>
scan
loaded .
vst3 Name Enabled Working: Comp|0|0

= A folder in the place of the catalogue stays and nothing is loaded in vain
put Comp.vst3:
write Effects/VST3Configuration.xml/kept: old
scan
loaded .
log: Cannot write the catalogue
holds Effects/VST3Configuration.xml/kept: old

= Leftovers of a temporary file do no harm
put Comp.vst3:
write Effects/VST3Configuration.xml.tmp: half a catalogue
scan
vst3 Name: Comp
write Effects/VST3Configuration.xml.tmp/x: a folder in its place
put New.vst3:
scan
vst3 Name: Comp, New

= Earlier versions are brought up to date without loading anything
put Comp.vst3:
scan
edit Effects/VST3Configuration.xml: <Effects version="1.1"> => <Effects version="0.9">
edit Effects/VST3Configuration.xml: 2021-03-04 05:06 => 04.03.21 05:06:07
scan
loaded .
vst3 Name FileTime: Comp|2021-03-04 05:06
same

= A scan list without folders empties the catalogues
put Comp.vst3, Echo.vst2:
scan
write Effects/FXScan.xml: <Scan><Folder>@/Plugins</Folder><Group><Path>@/Plugins</Path></Group></Scan>
scan
loaded .
vst3 Name: .
vst2 Name: .

= Folders that cannot be searched are named and passed over
put Comp.vst3:
write File: x
folders @/無い🎛 @/File @/Plugins
scan
log: Cannot search the folder "@/無い🎛": it does not exist
log: Cannot search the folder "@/File": it is not a folder
vst3 Name: Comp

= A folder that is listed twice is searched once
put Comp.vst3, Inner/Deep.vst3:
folders @/Plugins @/Plugins/ @/Plugins/Inner @/Plugins/Inner/..
scan
loaded Comp Deep
folders @/Plugins/Inner @/Plugins
put Inner/Deep.vst3: class D
put Comp.vst3: class C
remove Effects/VST3Configuration.xml
scan
loaded Deep Comp
vst3 Name: C, D

= Linked folders are searched once and a file stays where it is known
put z/Comp.vst3, z/Echo.vst2, ../Outside/Far.vst3, ../Store/Odd.vst3, ../Loose.vst3:
link Plugins/a Plugins/z
link Plugins/z/loop Plugins
link Plugins/z/top .
link Outside/up Outside
link Plugins/first Outside
link Plugins/second Outside/up
link Plugins/Named.vst3 Store/Odd.vst3
link Plugins/Also.vst3 Plugins/Named.vst3
link Plugins/None.vst3 Plugins/none
scan
loaded Comp Far Echo
vst3 Path: z/Comp.vst3, first/Far.vst3, Also.vst3
vst2 Name: Echo
remove Plugins/first
scan
loaded Far
vst3 Path: z/Comp.vst3, second/Far.vst3, Also.vst3
link Plugins/first Outside
same
folders @/Plugins/a @/Plugins
same
folders @/Plugins/a
scan
loaded Comp Echo
vst3 Path: a/Comp.vst3
folders @/Plugins @/Plugins/a
scan
loaded Far
vst3 Path: a/Comp.vst3, first/Far.vst3, Also.vst3

= A file stays where it is known in whatever order its folders are listed
put ../Store/Odd.vst3:
write W/x: x
link Plugins/up W
link Plugins/one.vst3 Store/Odd.vst3
link W/two.vst3 Store/Odd.vst3
folders @/Plugins/up @/Plugins
scan
vst3 Path: up/two.vst3
folders @/Plugins @/Plugins/up
same

= CLAP plug-ins are listed with all that they say and keep their marks
put Two.clap: class A | #1 | vendor V | version 2.1 | features audio-effect reverb x:y | class B | inputs 1 2:aux | outputs 6
put Some.clap/Inside.clap:
put Killer.clap: fault init kill
put Other.clap: class T | effect init umask 077 | effect init locale % | ask-host destroy "after all" for-ever
write Plugins/Empty.clap/Contents/x86_64-linux/Empty: x
write Plugins/Text.clap: not a module
scan 2
clap Name Path ID Vendor Version Features: A|Two.clap|00000000000000000000000000000001|V|2.1|audio-effect|reverb|x:y, B|Two.clap|fixture.B|Fixture Works|1.0|audio-effect, Inside|Some.clap/Inside.clap|fixture.Inside|Fixture Works|1.0|audio-effect, Killer|Killer.clap|Killer.clap|||, T|Other.clap|fixture.T|Fixture Works|1.0|audio-effect
clap Name FileTime CategoryMask Inputs Outputs Enabled Working: A|2021-03-04 05:06|16384|2|2|1|1, B|2021-03-04 05:06|0|1|6|1|1, Inside|2021-03-04 05:06|0|2|2|1|1, Killer|2021-03-04 05:06|0|-1|-1|0|0, T|2021-03-04 05:06|0|2|2|1|1
vst3 Name: .
same
mark A Favourite 1, A CategoryMask 2, B Enabled 0
new Two.clap: class Renamed | #1 | class B | class C
new Some.clap/Inside.clap: answer get-factory null
scan
loaded Inside Two
log: Inside.clap: it has no plug-in factory
clap Name FileTime CategoryMask Favourite Enabled Working: Renamed|2022-03-04 05:06|2|1|1|1, B|2022-03-04 05:06|0|0|0|1, C|2022-03-04 05:06|0|0|1|1, Inside|2021-03-04 05:06|0|0|1|1, Killer|2021-03-04 05:06|0|0|0|0, T|2021-03-04 05:06|0|0|1|1
folders @/Effects
scan
clap Name: .
same

= A CLAP module that is named as its plug-in crashes and comes back
put com.a.clap: class A | id com.a | class B
scan
mark A Favourite 1
new com.a.clap: class A | id com.a | fault entry-deinit kill
scan 2
clap Name ID Favourite Enabled Working: com.a|com.a.clap|0|0|0, A|com.a|1|0|0, B|fixture.B|0|0|0
same
retry com.a
put com.a.clap: class A | id com.a | class B
scan
clap Name ID Favourite Enabled Working: A|com.a|1|1|1, B|fixture.B|0|1|1
same

= What a bundle holds is never a VST 2 module
put Damaged.vst3/Left.vst2, Other.VST3/Contents/aarch64-other/Other.vst2, Good.vst2:
put .vst3/Own.vst2: id 2
put .vst3/Own.clap:
folders @/Plugins @/Plugins/.vst3
scan
vst2 Name: Good, Own
clap Name: Own
same

= A file for several formats is found by a link of each
put ../Store/Clap.clap, ../Store/Two.vst2:
write Plugins/X.vst3/Contents/Resources/x: x
link Plugins/1.vst2 Store/Clap.clap
link Plugins/2.clap Store/Clap.clap
link Plugins/X.vst3/Contents/Resources/X.vst2 Store/Two.vst2
link Plugins/z.vst2 Store/Two.vst2
scan
vst2 Path: z.vst2
clap Path: 2.clap
same

= A module that is cut short is looked at until it is whole again
put A.vst3, B.vst2:
put Shell.vst2: child 1 One | child 2 Two | fault entry kill Two
put Late.vst3: class New
short Plugins/Late.vst3 1000
scan 2
mark A Favourite 1
short Plugins/A.vst3 9000
short Plugins/B.vst2 0
short Plugins/Shell.vst2 70
scan
loaded .
log: Late.vst3: it is cut short: 1000 of at least
log: it is empty
vst3 Name FileTime Enabled Working: A||1|0, A|2021-03-04 05:06|1|0, Late||1|0
same
put A.vst3, B.vst2:
put Shell.vst2: child 1 One | child 2 Two | fault entry kill Two
put Late.vst3: class New
scan
loaded A Late B Shell
vst3 Name Favourite Working: A|1|1, New|0|1
vst2 Name Enabled Working: B|1|1, One|1|1, Two|0|0
same

= A module of which a part is blank is looked at until it is whole again
put C.clap, D.vst2, E.vst3:
scan
mark C Favourite 1, D Favourite 1, E Favourite 1
blank Plugins/C.clap 20000
blank Plugins/D.vst2 0
blank Plugins/E.vst3 8192
scan
loaded .
log: C.clap: it is cut short: a part of it is blank
vst2 Name FileTime Enabled Working: D||1|0
same
put C.clap, D.vst2, E.vst3:
scan
clap Name Favourite Working: C|1|1
vst2 Name Favourite Working: D|1|1
vst3 Name Favourite Working: E|1|1

= A file that is not a program library is not a plug-in
put T.vst3:
put Other.vst3: class Other
scan
write Plugins/T.vst3: INPUT(T.vst3.0)
write Plugins/ld.so: INPUT(ld.so.0)
write Plugins/ld.dll: MZ, but a text of more than the bytes that a header of any kind has
scan
vst3 Name: Other
vst2 Name: .
same

= A bundle without a module for this machine says what it has, and is looked at until it has one
write Plugins/X.vst3/Contents/aarch64-linux/X.so: x
scan
log: X.vst3: the bundle has modules for aarch64-linux only
vst3 FileTime Working: |0
put X.bundle:
scan
vst3 Name Working: X|1
write Plugins/Y.vst3/Contents/arm64-win/Y.vst3: y
write Plugins/Y.vst3/Contents/Resources/y.txt: y
write Plugins/Y.vst3/Contents/x86_64-linux/y.txt: y
write Plugins/Y.vst3/Contents/x86_64-win/y.txt: y
scan
log: Y.vst3: the bundle has modules for arm64-win, x86_64-win only / Y.vst3: the bundle has modules for arm64-win, x86_64-linux only
write Plugins/Z.vst3/z: z
link Plugins/Z.vst3/Contents Plugins/Z.vst3/Contents
scan
log: Z.vst3: its folder Contents cannot be searched: 

= Names of all sorts in both formats
put a/Comp.vst3: class Three1
put b/comp.vst3: class Three2
put 日本🎛/音🎛.vst3: class Foreign
put 日本🎛/致命的💥.vst3: class X | fault initialize kill
put a/Comp.vst2: name Two1
put b/comp.vst2: name Two2 | id 2
put 日本🎛/音🎛.vst2: name "Latin \xF6"
put 日本🎛/致命的💥.vst2: fault get-vendor-string kill
scan 3
vst3 Name Enabled Working: Three1|1|1, Three2|1|1, Foreign|1|1, 致命的💥|0|0
vst2 Name Enabled Working: Two1|1|1, Two2|1|1, Latin ö|1|1, 致命的💥|0|0
same

= Several killers of both formats need one run each and one more
put a/WaveShell1-VST3 9.2.vst3, b/WaveShell1-VST3 9.2.vst3: class Inner | fault module-entry kill
put Bad1.vst2, Bad2.vst2: fault get-vendor-string kill
put Good.vst3, Good.vst2:
scan 5
vst3 Name: Good
vst2 Name Enabled Working: Bad1|0|0, Bad2|0|0, Good|1|1

= A marker of a file that was moved follows it and one of a file that is there stays there
put a/Comp.vst3:
put b/Same.vst3: class B
scan
write Effects/1.scan3: <CrashedPlugin><Path>@/Plugins/a/Comp.vst3</Path><Created>2021-03-04 05:06</Created><Name>Comp</Name></CrashedPlugin>
write Effects/2.scan3: <CrashedPlugin><Path>@/gone/Same.vst3</Path><Created>2021-03-04 05:06</Created><Name>Same</Name></CrashedPlugin>
scan
vst3 Name Enabled Working: Comp|0|0, Comp|0|0, B|1|1
same

= Markers outlive a catalogue that cannot be written and those of no use do not
put Comp.vst3:
write Effects/VST3Configuration.xml/kept: old
write Effects/Comp.scan3: <CrashedPlugin><Path>@/Plugins/Comp.vst3</Path><Name>Comp</Name></CrashedPlugin>
write Effects/bad.scan: <CrashedPlugin><Path>/x
run
markers Comp.scan3

= A copy is not loaded again while the file that holds its identifiers is there
put a/Comp.vst3, b/Comp.vst3: class A
scan
vst3 Name: A
scan
loaded .
remove Plugins/a/Comp.vst3
write Plugins/a/other: content
scan
loaded Comp
vst3 Name: A
same

= A renamed class keeps its marks and what is switched off is not asked
put Comp.vst3: class Liked | #1 | class Gone
put Off.vst3:
scan
mark Liked Favourite 1, Liked CategoryMask 16384, Off Enabled 0
new Comp.vst3: class New | subcategories Fx|EQ | class Renamed | subcategories Fx|EQ | #1
new Off.vst3: class Changed
scan
loaded Comp
vst3 Name FileTime CategoryMask Favourite Enabled: New|2022-03-04 05:06|16|0|1, Renamed|2022-03-04 05:06|16384|1|1, Off|2021-03-04 05:06|0|0|0
same

= A WaveShell that crashed is left alone for one run and an empty one keeps its records
put WaveShell1.vst3: class W | fault initialize kill
put a Healthy.vst3:
run
markers WaveShell1.scan3
scan
loaded .
vst3 Name: a Healthy
run
loaded WaveShell1
put WaveShell1.vst3: class W
scan
scan
new WaveShell1.vst3: class W | category None
scan
scan
loaded WaveShell1
vst3 Name Enabled Working: W|1|1, a Healthy|1|1

= Bundles are found under all sorts of names
put Several.bundle:
put Several.vst3/Contents/arm64-win/Foreign.vst3:
put Before.bundle:
move Plugins/Before.vst3 Plugins/After.vst3
put Loud.bundle:
move Plugins/Loud.vst3 Plugins/Loud.VST3
scan
vst3 Name Working: Before|1, Loud|1, Several|1
same

= A bundle has the time of its module
put Usual.bundle:
scan
write Plugins/Usual.vst3/Contents/moduleinfo.json: {}
same
new Usual.bundle:
scan
loaded Usual
vst3 Path FileTime: Usual.bundle|2022-03-04 05:06

= What a plug-in changes is put back
put A.vst2: effect entry umask 077 | effect entry locale % | effect entry chdir / | effect entry rounding up
put B.vst2: id 2 | effect entry signal segv | effect entry signal term | effect entry alarm 1
put C.vst2: id 3 | effect get-vendor-string umask 077 | effect get-vendor-string locale %
put D.vst2: id 4 | effect get-vendor-string signal term | effect get-vendor-string alarm 1
put E.vst2: id 5 | effect get-effect-name signal segv | fault get-vendor-string segv
put F.vst2: id 6 | effect entry thread
put G.vst2: id 7 | ask-host entry 1 until-close | ask-host get-vendor-string 7 until-close
scan
vst2 Name Working: A|1, B|1, C|1, D|1, E|1, F|1, G|1
log: F.vst2 left threads running and stays in memory
readable Effects/FXConfiguration.xml
same

= Every child of a shell is listed and every effect closed
put Shell.vst2: child 1 One | child 2 Two | child 0x80000003 Three
put Twice.vst2: child 1 A | child 2 B | answer entry null 2 | after-children repeat
scan
loaded Shell Twice
vst2 Name ID Working: A|A:1|1, B|B|0, One|One:1|1, Three|Three:-2147483645|1, Two|Two:2|1
closed Shell: close Three, close Two, close One, close Shell, static-destructor
same

= A deadly child disables only itself until its shell changes
put WaveShell1-VST 9.3_x64.vst2: child 1 One | child 2 Two | child 0x80000003 Three | fault entry kill 2
scan 2
vst2 Name ID Enabled Working: One|One:1|1|1, Three|Three:-2147483645|1|1, Two|Two|0|0
same
mark One Favourite 1, Three Enabled 0
new WaveShell1-VST 9.3_x64.vst2: child 1 One | child 2 Two | child 0x80000003 Three
scan
vst2 Name Enabled Working Favourite: One|1|1|1, Three|0|1|0, Two|1|1|0

= Of two versions of a shell the older is not asked again
put WaveShell1-VST 9.2_x64.vst2, WaveShell1-VST 9.3_x64.vst2: child 1 One
scan
vst2 Name Path: One|WaveShell1-VST 9.3_x64.vst2
same

= A child of its shell's name leaves the shell's marker alone
put Shell.vst2: child 1 Shell | child 2 "../../Up" | fault static-destructor kill
scan 2
vst2 Name Enabled Working: Shell|0|0

= Files of any date are asked once and those touched within a minute are not
put Old.vst3, New.vst2, Touched.vst3:
date Plugins/Old.vst3 1970-01-02T00:00:00
date Plugins/New.vst2 2099-12-31T23:59:59
scan
vst3 Name FileTime: Old|1970-01-02 00:00, Touched|2021-03-04 05:06
vst2 Name FileTime: New|2099-12-31 23:59
date Plugins/Touched.vst3 2021-03-04T05:06:59
same

= Names that differ only in case are those of two files where the system says so
put Comp.vst3: class A
put comp.vst3: class B
put Echo.vst2: name C
put echo.vst2: name D | id 2
scan
vst3 Name: A, B / B
vst2 Name: C, D / D
same

= Folders that change during a scan
put a/Slow.vst3: delay initialize 400
put b/Gone.vst3, b/Gone.vst2:
during Slow: move Plugins/b Plugins/c
write Plugins/b/other: x
scan
loaded Gone Gone
vst3 Path Working: a/Slow.vst3|1, c/Gone.vst3|1
vst2 Path Working: c/Gone.vst2|1
same

= A plug-in without a record is listed when its fault is gone
put Comp.vst3: class Comp | answer get-factory null
put Echo.vst2: answer entry null
scan
vst3 Name: .
vst2 Name ID Enabled Working: Echo|Echo|1|0
new Comp.vst3, Echo.vst2:
scan
vst3 Name Working: Comp|1
vst2 Name Working: Echo|1
same
)";

} // namespace

TEST_P(ScanTable, EndsAsItSays) { carryOutAll(); }

INSTANTIATE_TEST_SUITE_P(Of, ScanTable, testing::ValuesIn(scanCases(kScans)), nameOfScan);
