#include "Main/AudioEngineController/Effects/Protocol/ReportReader.h"

#include "Tests/Fuzz/FuzzTarget.h"

#include <tuple>

namespace {

bool isSame(const ReportLine &left, const ReportLine &right)
{
    const auto all = [](const ReportLine &line) {
        return std::tie(line.event, line.format, line.path, line.subId, line.subName, line.stage, line.reason,
                        line.milliseconds, line.records, line.probes, line.status, line.time, line.files,
                        line.worker);
    };
    return all(left) == all(right);
}

} // namespace

void fuzzReport(const QByteArray &input)
{
    const QString file = "FxProbe.report";
    writeFuzzFile(file, "");
    ReportReader whole(file), inPieces(file);
    writeFuzzFile(file, input.left(input.size() / 2));
    std::vector<ReportLine> pieces = inPieces.takeNewLines();
    writeFuzzFile(file, input);
    for (const ReportLine &line : inPieces.takeNewLines())
        pieces.push_back(line);
    const std::vector<ReportLine> lines = whole.takeNewLines();
    require(static_cast<int>(lines.size()) == input.count('\n'), "each whole line is told, damaged or not");
    require(std::equal(lines.begin(), lines.end(), pieces.begin(), pieces.end(), isSame),
            "a line says the same, however the report grew");
}
