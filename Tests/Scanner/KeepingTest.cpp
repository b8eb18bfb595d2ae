#include "Tests/Scanner/ScanTable.h"

namespace {

// What a user has done and what ended the scanner, through updates, moves and accidents.
const char kScans[] = R"(
= A failed update costs and spreads no marks
put Three.vst3: class A | #1 | class B | #2 | class C | #3
put Shell.vst2: child 1 D | child 2 E | child 3 F
scan
mark A Favourite 1, B CategoryMask 4, C Enabled 0, D Favourite 1, E CategoryMask 4, F Enabled 0
new Three.vst3: answer module-entry false
new Shell.vst2: answer entry null
scan
vst3 Name Favourite CategoryMask Enabled Working: Three|0|0|1|0, A|1|0|1|0, B|0|4|1|0, C|0|0|0|1
vst2 Name Favourite CategoryMask Enabled Working: Shell|0|0|1|0, D|1|0|1|0, E|0|4|1|0, F|0|0|0|1
same
put Three.vst3: class A | #1 | class B | #2 | class C | #3
put Shell.vst2: child 1 D | child 2 E | child 3 F
scan
vst3 Name Favourite CategoryMask Enabled Working: A|1|0|1|1, B|0|4|1|1, C|0|0|0|1
vst2 Name Favourite CategoryMask Enabled Working: D|1|0|1|1, E|0|4|1|1, F|0|0|0|1

= What was retried after a crash has its own marks
put Three.vst3: class A | #1 | class B | #2 | class C | #3
put Shell.vst2: child 1 D | child 2 E
scan
mark A Favourite 1, B CategoryMask 4, C Enabled 0, D Favourite 1
new Three.vst3: class A | #1 | fault module-entry kill
new Shell.vst2: child 1 D | child 2 E | fault get-plug-category kill
scan 3
vst3 Name Favourite CategoryMask Enabled Working: Three|0|0|0|0, A|1|0|0|0, B|0|4|0|0, C|0|0|0|1
vst2 Name Favourite Enabled Working: Shell|0|0|0, D|1|0|0, E|0|0|0
same
retry A
retry E
put Three.vst3: class A | #1 | class B | #2 | class C | #3
put Shell.vst2: child 1 D | child 2 E
scan
vst3 Name Favourite CategoryMask Enabled Working: A|1|0|1|1, B|0|4|1|1, C|0|0|0|1
vst2 Name Favourite Enabled Working: D|1|1|1, E|0|1|1

= A shell that crashed as a whole is asked for each child where it moved
put a/Shell.vst2: child 1 D | child 2 E
write Plugins/a/other: x
scan
new a/Shell.vst2: child 1 D | child 2 E | fault get-plug-category kill
scan 2
remove Plugins/a/Shell.vst2
new b/Shell.vst2: child 1 D | child 2 E
scan
vst2 Name Enabled Working: D|1|1, E|1|1

= A child that killed is not loaded where its file moved and another child kills
put a/Shell.vst2: child 1 D | child 2 E | fault entry kill D
write Plugins/a/other: x
scan 2
remove Plugins/a/Shell.vst2
put b/Shell.vst2: child 1 D | child 2 E | fault entry kill E
scan 2
vst2 Name Enabled Working: D|0|0, E|0|0

= What an earlier version left usable beside a crash is disabled
put Multi.vst3: class A | #1 | class B | #2 | fault module-entry kill
write Effects/VST3Configuration.xml: <Effects version="1.1"><Effect><Path>@/Plugins/Multi.vst3</Path><FileTime>2021-03-04 05:06</FileTime><Name>A</Name><ID>Multi</ID><Enabled>0</Enabled><Working>0</Working></Effect><Effect><Path>@/Plugins/Multi.vst3</Path><FileTime>2021-03-04 05:06</FileTime><Name>B</Name><ID>2</ID></Effect></Effects>
scan
loaded .
vst3 Name Enabled Working: A|0|0, B|0|0

= Texts that look like markup stay whole and keep their marks
put A.vst2: name "Top <br/> Boost &amp; &lt;" | vendor "Jo <jo x.org> & Co"
put B.vst3: class "A &amp; B" | vendor "Jo <jo x.org> & Co"
scan
mark Top <br/> Boost &amp; &lt; Favourite 1, A &amp; B Favourite 1
new B.vst3: class "A &amp; B" | vendor V
put C.vst3:
put C.vst2: id 2
scan
loaded B C C
vst2 Name Vendor Favourite: Top <br/> Boost &amp; &lt;|Jo <jo x.org> & Co|1, C|Fixture Works|0
vst3 Name Vendor Favourite: A &amp; B|V|1, C|Fixture Works|0
same

= What the user switched off speaks for no file while others are on
put Two.vst3: class A | #1 | class B | #2
put Shell.vst2: child 1 D | child 2 E
scan
mark A Enabled 0
mark D Enabled 0
mark E Enabled 0
same
new Two.vst3: class A | #1 | class C | #3
new Shell.vst2: child 1 D | child 3 F
scan
vst3 Name Enabled: A|0, C|1
vst2 Name Enabled: D|0, F|1

= A link whose drive is away keeps its plug-in
put Comp.vst3:
write drive/here: x
move Plugins/Comp.vst3 drive/Comp.vst3
link Plugins/Comp.vst3 drive/Comp.vst3
scan
mark Comp Favourite 1
move drive away
scan
move away drive
scan
vst3 Name Favourite Working: Comp|1|1

= An old killer gets nothing of a namesake that is uninstalled
put a/C.vst3: class C | fault module-entry kill
scan 2
put b/C.vst3: class X | #1
write Plugins/b/other: x
scan
mark X Favourite 1
remove Plugins/b/C.vst3
scan
vst3 Name Favourite Enabled: C|0|0

= A copy that goes on with what a failed update lists no more has its marks
put a/M.vst3: class P | #1
scan
mark P Favourite 1
new a/M.vst3: class P | answer module-entry false
put b/N.vst3: class P | #1
scan
vst3 Name Path Favourite: M|a/M.vst3|0, P|b/N.vst3|1

= A torn scan list costs nothing
put Comp.vst3:
scan
write Effects/FXScan.xml: <?xml version="1.0" encoding="UTF-8"?>\n<Scan>\n\t<Path>@/Plug
run
exit 2
vst3 Name: Comp

= A folder that is away keeps its plug-ins and its killer until it leaves the list
put b/Comp.vst3:
put b/Bad.vst3: class X | fault module-entry kill
put b/Echo.vst2:
folders @/Plugins/b
scan 2
mark Comp Favourite 1
move Plugins/b Away
scan
vst3 Name Favourite Enabled: Bad|0|0, Comp|1|1
vst2 Name: Echo
write Plugins/b/x: y
remove Plugins/b/x
same
move Away Plugins/b
same
folders @/Plugins/c
scan
vst3 Name: .
vst2 Name: .

= A moved WaveShell that lists nothing leaves no dead path
put a/WaveShell1-VST3 9.2.vst3: class Inner | #1
write Plugins/a/other: x
scan
mark Inner Favourite 1
put f/WaveShell1-VST3 9.2.vst3: class Controller | category "Component Controller Class"
remove Plugins/a/WaveShell1-VST3 9.2.vst3
scan
vst3 Name Path Favourite: Inner|f/WaveShell1-VST3 9.2.vst3|1

= A moved WaveShell that ends the scanner keeps its marks
put a/WaveShell1-VST3 9.2.vst3: class Inner | #1
write Plugins/a/other: x
scan
mark Inner Favourite 1
remove Plugins/a/WaveShell1-VST3 9.2.vst3
put f/WaveShell1-VST3 9.2.vst3: class Inner | #1 | fault module-entry kill
scan 2
vst3 Name Path Favourite Enabled: Inner|f/WaveShell1-VST3 9.2.vst3|1|1

= A killer among them costs no marks of what moves and is renamed, or goes over to a copy
put a/C.vst2: name C | id 1
put b/D.vst2: child 1 P | child 2 Q
put b/D.vst3: class P | #1 | class Q | #2
write Plugins/a/other: x
scan
mark C Favourite 1, Q Favourite 1
remove Plugins/a/C.vst2
put f/C.vst2: name E | id 2
new b/D.vst2: child 1 P
new b/D.vst3: class P | #1
put n/K.vst2: fault entry kill
put n/K.vst3: fault module-entry kill
put z/D.vst2: child 2 Q
put z/D.vst3: class Q | #2
scan 3
vst2 Name Path Favourite: E|f/C.vst2|1, K|n/K.vst2|0, P|b/D.vst2|0, Q|z/D.vst2|1
vst3 Name Path Favourite: K|n/K.vst3|0, P|b/D.vst3|0, Q|z/D.vst3|1
same

= A killer among them costs no marks of what another file lists instead of one that crashed
put b/B.vst3: class S | #1
scan
mark S Favourite 1
new b/B.vst3: class S | #1 | fault module-entry kill
put c/A.vst3: class S | #1 | class T | #2
put d/D.vst3: fault module-entry kill
scan 3
vst3 Name Path Favourite: B|b/B.vst3|0, S|c/A.vst3|1, T|c/A.vst3|0, D|d/D.vst3|0

= A copy has what the last file to crash listed
put b/B.vst3: class S | #1
put c/A.vst3: class S | #1 | class T | #2
put b/B.vst2, c/A.vst2: name D | id 7
scan
mark S Favourite 1, D Favourite 1
new b/B.vst3: class S | #1 | fault module-entry kill
new b/B.vst2: fault entry kill
scan 3
vst3 Name Path Favourite: B|b/B.vst3|0, S|c/A.vst3|1, T|c/A.vst3|0
vst2 Name Path Favourite Working: A|c/A.vst2|1|1, D|b/B.vst2|1|0
scan
same

= A file is asked for what another one lists no more, whatever a scan that was cut off remembers
put a/B.vst3: class S | #1
put c/B.vst3: class S | #1 | class T | #2
scan
mark S Favourite 1
edit Effects/FXProbes.json: "heldBy":"@/Plugins/a/B.vst3" => "heldBy":""
new a/B.vst3: class U | #3
scan
vst3 Name Path Favourite: U|a/B.vst3|0, S|c/B.vst3|1, T|c/B.vst3|0
same

= A plug-in keeps its marks whichever of several files that are asked lists it
put a/A.vst3: class Q | #1
put a/B.vst3: class R | #2 | class S | #3
put x/X.vst3: class P | #4
put x/X.vst2: name V | id 4
put x/O.vst2: name M | id 5
put y/O.vst2: name N | id 6
write Plugins/x/other: x
scan
mark P Favourite 1, S Favourite 1, V Favourite 1, M Favourite 1, N CategoryMask 4
new a/A.vst3: class Q | #1 | class P | #4
new a/B.vst3: class R | #2
put a/A.vst2: name V | id 4
put a/K.vst3: fault module-entry kill
put z/C.vst3: class S | #3
move Plugins/x/X.vst3 Plugins/y/X.vst3
move Plugins/x/X.vst2 Plugins/y/X.vst2
remove Plugins/x/O.vst2
put y/O.vst2: name M | id 5
scan 2
vst3 Name Path Favourite: K|a/K.vst3|0, P|a/A.vst3|1, Q|a/A.vst3|0, R|a/B.vst3|0, S|z/C.vst3|1
vst2 Name Path Favourite CategoryMask: M|y/O.vst2|1|0, V|y/X.vst2|1|0
same

= A shell that moved and crashes beside one of its children keeps their marks
put a/S.vst2: child 1 D | child 2 E
write Plugins/a/other: x
scan
mark D Favourite 1, E Favourite 1
remove Plugins/a/S.vst2
put c/S.vst2: child 1 D | child 2 E | fault entry kill D | fault static-destructor kill
scan 3
vst2 Name Path Favourite Enabled: S|c/S.vst2|0|0, D|c/S.vst2|1|0, E|c/S.vst2|1|0
same

= Marks follow to where a file moved and crashed, also when others end the scanner after it
put a/B.vst3: class S | #1
put a/B.vst2: child 1 D | child 2 E
write Plugins/a/other: x
scan
mark S Favourite 1, D Favourite 1
remove Plugins/a/B.vst3
remove Plugins/a/B.vst2
put b/B.vst3: class S | #1 | fault module-entry kill
put b/B.vst2: child 1 D | child 2 E | fault entry kill
put z/K.vst3: fault module-entry kill
put z/K.vst2: fault entry kill
scan 5
vst3 Name Path Favourite Enabled: B|b/B.vst3|0|0, S|b/B.vst3|1|0, K|z/K.vst3|0|0
vst2 Name Path Favourite Enabled: B|b/B.vst2|0|0, D|b/B.vst2|1|0, E|b/B.vst2|0|0, K|z/K.vst2|0|0
same

= A catalogue that somebody edited keeps its marks and its killer
put E.vst3: class "Top <br/> E" | vendor "Jo <jo x.org>" | #1
put K.vst3: class K | fault module-entry kill
put N.vst3: class N | #3 | class O | #4
put S.vst2: child 1 "Top <br/> P" | child 2 Q
scan 2
mark Top <br/> E Favourite 1, N CategoryMask 4, O Enabled 0, Q Favourite 1
edit Effects/VST3Configuration.xml: <Effects version="1.1"> => \t<Effects version='1.1'>
edit Effects/VST3Configuration.xml: <Name>K</Name> => <Name>K</Name>\t
edit Effects/FXConfiguration.xml: </Effects> => <!-- by hand -->
edit Effects/FXConfiguration.xml: <ID>2</ID> => <ID>2</ID>\t
scan
loaded .
vst3 Name Favourite CategoryMask Enabled Working: K|0|0|0|0, N|0|4|1|1, O|0|0|0|1, Top <br/> E|1|0|1|1
vst2 Name Favourite: Top <br/> P|0, Q|1
same

= A damaged catalogue has what works asked again, and keeps the marks and the killer that can be read
put E.vst3: class E | vendor "Jo <jo x.org>" | #1
put K.vst3: class K | fault module-entry kill
put N.vst3: class N | #3 | class O | #4
put S.vst2: child 1 P | child 2 Q
scan 2
mark E Favourite 1, N CategoryMask 4, O Enabled 0, P Favourite 1
edit Effects/VST3Configuration.xml: <Name>K</Name> => <Name>K</Nam
edit Effects/VST3Configuration.xml: <Vendor>Jo <jo x.org></Vendor> => Jo
cut Effects/FXConfiguration.xml: <ID>2</ID>
scan
loaded E N S
vst3 Name Favourite CategoryMask Enabled Working: E|1|0|1|1, K|0|0|0|0, N|0|4|1|1, O|0|0|0|1
vst2 Name Favourite: P|1, Q|0
same

= A copy that failed before keeps what an uninstalled one held
put a/M.vst3, a/M.clap: class A | #1 | class B | #2
put a/M.vst2: child 1 A | child 2 B
write Plugins/a/other: x
scan
mark A Favourite 1, B CategoryMask 4
put b/M.vst3: class A | #1 | answer module-entry false
put b/M.clap: class A | #1 | answer entry-init failure
put b/M.vst2: child 1 A | answer entry null
scan
remove Plugins/a/M.vst3
remove Plugins/a/M.clap
remove Plugins/a/M.vst2
scan
new b/M.vst3, b/M.clap: class A | #1 | class B | #2
new b/M.vst2: child 1 A | child 2 B
scan
vst3 Name Path Favourite CategoryMask: A|b/M.vst3|1|0, B|b/M.vst3|0|4
clap Name Path Favourite CategoryMask: A|b/M.clap|1|0, B|b/M.clap|0|4
vst2 Name Path Favourite CategoryMask: A|b/M.vst2|1|0, B|b/M.vst2|0|4
same

= What a process that ended may not have written down is asked again
put Fail.vst3: answer module-entry false
put Kill.vst3:
scan
write Effects/FXProbes.json: {}
write Effects/1.scan3: <CrashedPlugin><Path>@/Plugins/Kill.vst3</Path><Name>Kill</Name></CrashedPlugin>
scan
loaded Fail
same

= A folder that bears a marker's name costs no crash
write Effects/Kill.scan3/x: x
write Effects/Dead.scan/x: x
put Kill.vst3: fault module-entry kill
put Dead.vst2: fault entry kill
scan 3
vst3 Name Enabled Working: Kill|0|0
vst2 Name Enabled Working: Dead|0|0

= A copy that crashed before keeps what an uninstalled one held, disabled
put a/M.vst3: class A | #1 | class B | #2
put a/N.vst2: child 1 C | child 2 D
write Plugins/a/other: x
scan
mark A Favourite 1, B CategoryMask 4, D Favourite 1
put b/M.vst3: class A | #1 | class B | #2
put b/N.vst2: child 1 C | child 2 D
scan
new b/M.vst3: fault module-entry kill
new b/N.vst2: fault get-plug-category kill
scan 3
remove Plugins/a/M.vst3
remove Plugins/a/N.vst2
scan
loaded .
vst3 Name Path Favourite CategoryMask Enabled Working: A|b/M.vst3|1|0|0|0, B|b/M.vst3|0|4|0|0, M|b/M.vst3|0|0|0|0
same
retry M
retry N
new b/M.vst3: class A | #1 | class B | #2
new b/N.vst2: child 1 C | child 2 D
scan
vst3 Name Path Favourite CategoryMask Enabled Working: A|b/M.vst3|1|0|1|1, B|b/M.vst3|0|4|1|1
vst2 Name Path Favourite Enabled Working: C|b/N.vst2|0|1|1, D|b/N.vst2|1|1|1

= A copy lists what another file of another name held, with its marks, also when the rest of it is switched off and nothing is remembered
put x/M.vst3: class A | #1 | class D | #4
put z/Other.vst3: class A | #1 | class C | #3
write Plugins/x/other: x
scan
mark A Favourite 1, C Enabled 0
write Effects/FXProbes.json: {}
remove Plugins/x/M.vst3
scan
vst3 Name Path Favourite Enabled: A|z/Other.vst3|1|1, C|z/Other.vst3|0|0
same

= A plug-in whose file has another name in each version keeps its marks
put WaveShell1-VST3 9.2.vst3: class Inner | #1
put Shell 9.2.vst2: child 1 D | child 2 E
scan
mark Inner Favourite 1, E Favourite 1
remove Plugins/WaveShell1-VST3 9.2.vst3
remove Plugins/Shell 9.2.vst2
put WaveShell1-VST3 9.3.vst3: class Inner | #1
put Shell 9.3.vst2: child 1 D | child 2 E
scan
vst3 Name Favourite: Inner|1
vst2 Name Favourite: D|0, E|1

= What is asked again and fails is not asked at each scan, whatever is switched off in it
put M.vst3: class A | #1 | class B | #2
scan
mark B Enabled 0
new M.vst3: class A | answer module-entry false
scan
retry A
scan
loaded M
same

= A catalogue of a negative version keeps its categories
put Comp.vst3:
put Comp.clap:
scan
mark Comp CategoryMask 4
edit Effects/VST3Configuration.xml: version="1.1" => version="-1"
edit Effects/CLAPConfiguration.xml: version="1.0" => version="-1"
scan
loaded .
vst3 Name CategoryMask: Comp|4
clap Name CategoryMask: Comp|4

= A new file of a known name and time is asked and starts without marks
put a/Comp.vst3: class A | #1
put a/Comp.vst2: name D | id 1
scan
mark A Favourite 1, D Favourite 1
put b/Comp.vst3: class B | #2
put b/Comp.vst2: name E | id 2
scan
loaded Comp Comp
vst3 Name Favourite: A|1, B|0
vst2 Name Favourite: D|1, E|0
same
)";

class Keeping : public ScanTable {};

} // namespace

TEST_P(Keeping, EndsAsItSays) { carryOutAll(); }

INSTANTIATE_TEST_SUITE_P(Of, Keeping, testing::ValuesIn(scanCases(kScans)), nameOfScan);
