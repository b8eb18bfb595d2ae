#include "Tests/Scanner/ScanTable.h"

// What a scan searches, and what it leaves alone.

namespace {

class LimitedScan : public ScanTable {};

const char kScans[] = R"(
= A limited scan searches only what it names and keeps the rest
put a/One.vst3, b/Two.vst3, c/Echo.vst2:
write Plugins/c/other: x
scan
mark Two Favourite 1
new a/One.vst3, b/Two.vst3:
put a/deep/Three.vst3, b/Four.vst3:
remove Plugins/c/Echo.vst2
only @/Plugins/a @/nowhere
scan
loaded One Three
vst3 Name FileTime Favourite: One|2022-03-04 05:06|0, Three|2021-03-04 05:06|0, Two|2021-03-04 05:06|1
vst2 Name: Echo
same
only
scan
loaded Two Four
vst2 Name: .

= A module is as good a path as a folder
put One.vst3, Two.vst3, sub/Echo.vst2, Pack.bundle:
only @/Plugins/One.vst3 @/Plugins/sub/Echo.vst2 @/Plugins/Pack.vst3/Contents
scan
vst3 Name: One, Pack
vst2 Name: Echo
remove Plugins/One.vst3
scan
vst3 Name: Pack
only
folders @/Plugins/Two.vst3 @/Plugins/Pack.vst3 @/Plugins/sub/Echo.vst2
scan
vst3 Name: Two, Pack
vst2 Name: Echo
same
remove Plugins/Two.vst3
folders @/Plugins/Two.vst3 @/Plugins/Pack.vst3 @/Plugins
scan
vst3 Name: Pack

= What moved is known again by the scan that finds it
put a/Comp.vst3:
write Plugins/a/other: x
scan
mark Comp Favourite 1
move Plugins/a/Comp.vst3 Plugins/b/Comp.vst3
only @/Plugins/b
scan
vst3 Path Favourite: b/Comp.vst3|1
only @/Plugins/a
same
only
same

= What moved out of the searched part keeps marks and crashes until it is found
put a/Comp.vst3, a/Plain.vst3:
put a/Shell.vst2: child 1 One | child 2 Two | fault entry abort Two
write Plugins/a/other: x
scan 2
mark Comp Favourite 1
move Plugins/a/Comp.vst3 Plugins/b/Comp.vst3
move Plugins/a/Shell.vst2 Plugins/b/Shell.vst2
remove Plugins/a/Plain.vst3
only @/Plugins/a
scan
vst3 Path Favourite: a/Comp.vst3|1
vst2 Name Working: Two|0
same
only @/Plugins/b
scan
vst3 Path Favourite: b/Comp.vst3|1
vst2 Name Working: One|1, Two|0
same
only
same

= What is gone from everywhere goes with its marks
put a/Comp.vst3, a/Other.vst3:
scan
mark Comp Favourite 1
remove Plugins/a/Comp.vst3
only @/Plugins/a
scan
vst3 Path Favourite: a/Comp.vst3|1, a/Other.vst3|0
only
scan
vst3 Path Favourite: a/Other.vst3|0

= A plug-in of a folder that is away is used where it is found
put a/Comp.vst3, b/Other.vst3:
scan
mark Comp Favourite 1
move Plugins/a Away
put b/Comp.vst3:
only @/Plugins/b
scan
vst3 Path Favourite: b/Comp.vst3|1, b/Other.vst3|0

= A working plug-in takes the identifier of one that failed elsewhere
put a/Comp.vst3: class Comp | answer initialize false
put b/Other.vst3: class Comp | #1
scan
only @/Plugins/b
put b/Comp.vst3: class Comp
scan
loaded Comp

= A crash outside is known and a suspect outside stays one
put a/One.vst3, b/Two.vst3:
scan
write Effects/1.scan3: <CrashedPlugin><Path>@/Plugins/a/One.vst3</Path><Created>2021-03-04 05:06</Created><Name>One</Name></CrashedPlugin>
write Effects/2.scan3: <CrashedPlugin>\n\t<Path>@/Plugins/a/New.vst3</Path>\n\t<Created>2021-03-04 05:06</Created>\n\t<Name>New</Name>\n\t<Suspect>1</Suspect>\n</CrashedPlugin>\n
only @/Plugins/b
run
vst3 Name Enabled Working: One|0|0, One|0|0, Two|1|1
markers 2.scan3

= A file that is known by a link outside stays under that path
put ../Store/x/Far.vst3, One.vst3:
link Plugins/link Store
scan
folders @/Plugins @/Store/x
only @/Store/x
new ../Store/x/Far.vst3:
scan
loaded Far
vst3 Path: link/x/Far.vst3, One.vst3

= An excluded folder is never searched in whatever way it is reached
put a/One.vst3, a/deep/Two.vst3, b/Three.vst3:
write Plugins/a/other: x
scan
link Plugins/b/link Plugins/a
excluded @/Plugins/a
scan
loaded .
vst3 Name: Three
folders @/Plugins/a @/Plugins/b
same
only @/Plugins/a
same
only
excluded
scan
loaded One Two

= What is ignored is listed and never loaded and has its marks when it is not ignored any more
put Comp.vst3: class A | class B
put Bad.vst3: fault initialize kill
put sub/New.vst3, sub/Echo.vst2:
ignored @/Plugins/sub
scan 2
vst3 Name FileTime Enabled Working: A|2021-03-04 05:06|1|1, B|2021-03-04 05:06|1|1, Bad|2021-03-04 05:06|0|0, New|ignored|0|0
vst2 Name FileTime Enabled Working: Echo|ignored|0|0
same
mark A Favourite 1, A CategoryMask 16384, B Enabled 0
ignored @/Plugins
new Comp.vst3: class A | class B
scan
loaded .
vst3 Name Favourite Enabled Working: A|1|0|0, B|0|0|1, Bad|0|0|0, New|0|0|0
same
ignored
scan
loaded Comp New Echo
vst3 Name Favourite CategoryMask Enabled Working: A|1|16384|1|1, B|0|0|0|1, Bad|0|0|0|0, New|0|0|1|1
vst2 Name Enabled Working: Echo|1|1
same

= What moves into an ignored folder keeps its marks
put a/Comp.vst3: class A
put a/Bad.vst3: fault initialize kill
write Plugins/a/other: x
scan 2
mark A Favourite 1
mark Bad Favourite 1
ignored @/Plugins/b
move Plugins/a/Comp.vst3 Plugins/b/Comp.vst3
only @/Plugins/b
scan
vst3 Name Path FileTime Favourite: A|b/Comp.vst3|ignored|1, Bad|a/Bad.vst3|2021-03-04 05:06|1
only
move Plugins/a/Bad.vst3 Plugins/b/Bad.vst3
scan
vst3 Name Path FileTime Favourite: A|b/Comp.vst3|ignored|1, Bad|b/Bad.vst3|ignored|1
same
ignored
scan 2
vst3 Name Path Favourite Working: A|b/Comp.vst3|1|1, Bad|b/Bad.vst3|1|0

= A copy takes the place of what is ignored
put a/Comp.vst3, b/Comp.vst3: class Comp
scan
mark Comp Favourite 1
ignored @/Plugins/a/Comp.vst3
scan
loaded Comp
vst3 Path Favourite Working: a/Comp.vst3|0|0, b/Comp.vst3|1|1
same

= Rules that cannot be used end the scan before anything is touched
put Comp.vst3:
scan
new Comp.vst3:
write Effects/FXFolders.json: {"version":1,"excluded":["@/Plugins"
run
exit 2
loaded .
log: FXFolders.json cannot be used, so nothing is scanned:
vst3 Name FileTime: Comp|2021-03-04 05:06
write Effects/FXFolders.json: {"version":2}
run
exit 2
write Effects/FXFolders.json: {"version":1,"ignored":"x"}
run
exit 2
)";

} // namespace

TEST_P(LimitedScan, EndsAsItSays) { carryOutAll(); }

INSTANTIATE_TEST_SUITE_P(Of, LimitedScan, testing::ValuesIn(scanCases(kScans)), nameOfScan);
