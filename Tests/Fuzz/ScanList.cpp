#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"

#include "Tests/Fuzz/FuzzTarget.h"

void fuzzScanList(const QByteArray &input)
{
    const QString path = QString::fromUtf8(input);
    require(path.startsWith(dataFolderOf(path)), "the data folder is the start of the list's path");

    const QString list = "FXScan.xml";
    writeFuzzFile(list, input);
    const ScanListContents contents = ReadScanList(list);
    require(contents || contents.folders.isEmpty(), "a list that cannot be used names no folders");
    if (anyHolds({contents.folders.join(QString())}, "\n"))
        return; // nothing is escaped
    require(bool(WriteScanList(list, contents.folders)), "a scan list can be written");
    require(ReadScanList(list).folders == contents.folders,
            "what was read is written and read again the same");
}
