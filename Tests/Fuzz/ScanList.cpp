#include "Main/AudioEngineController/Effects/Protocol/ScanList.h"

#include "Tests/Fuzz/FuzzTarget.h"

void fuzzScanList(const QByteArray &input)
{
    const QString path = QString::fromUtf8(input);
    require(path.startsWith(dataFolderOf(path)), "the data folder is the start of the list's path");

    const QString list = "FXScan.xml";
    writeFuzzFile(list, input);
    const QStringList folders = ReadScanList(list);
    if (anyHolds({folders.join(QString())}, "<&"))
        return; // nothing is escaped
    require(bool(WriteScanList(list, folders)), "a scan list can be written");
    require(ReadScanList(list) == folders, "what was read is written and read again the same");
}
