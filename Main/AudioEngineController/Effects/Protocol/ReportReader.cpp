#include "Main/AudioEngineController/Effects/Protocol/ReportReader.h"

#include "Main/AudioEngineController/Effects/Protocol/ProbeMemory.h"
#include "Main/AudioEngineController/Effects/Protocol/ReportLines.h"

#include <QFile>
#include <QFileInfo>
#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>
#include <iterator>

namespace {

using namespace ReportWord;

/// The place of a word in its table; the table's size for an unknown one.
template <std::size_t Size>
std::size_t placeOf(const QString &word, const char *const (&words)[Size])
{
    const auto found = std::find_if(std::begin(words), std::end(words),
                                    [&](const char *each) { return word == QLatin1String(each); });
    return static_cast<std::size_t>(std::distance(std::begin(words), found));
}

ReportLine lineOf(const QByteArray &text)
{
    const QJsonObject json = QJsonDocument::fromJson(text).object();
    const auto textOf = [&](const char *word) { return json.value(QLatin1String(word)).toString(); };
    ReportLine line;
    line.event = static_cast<ReportLine::Event>(placeOf(textOf(kEvent), kEvents));
    if (const PluginFormatInfo *format = formatOfKey(textOf(kFormat)))
        line.format = format->format;
    else if (json.contains(QLatin1String(kFormat)))
        line.event = ReportLine::Event::Unknown; // of a format that this version does not know
    line.path = textOf(kPath);
    line.subId = subIdOf(json.value(QLatin1String(kSubId)));
    line.subName = textOf(kSubName);
    if (const std::size_t stage = placeOf(textOf(kStage), kStages); stage < std::size(kStages))
        line.stage = static_cast<ProbeStage>(stage);
    line.reason = textOf(kReason);
    line.time = json.value(QLatin1String(kTime)).toDouble(-1);
    line.milliseconds = json.value(QLatin1String(kMilliseconds)).toDouble(-1);
    line.records = json.value(QLatin1String(kRecords)).toInt();
    line.files = json.value(QLatin1String(kFiles)).toInt();
    line.probes = json.value(QLatin1String(kProbes)).toInt();
    line.worker = json.value(QLatin1String(kWorker)).toInt();
    line.status = line.event == ReportLine::Event::Skipped
                      ? ProbeStatus::NoPlugin
                      : statusOfText(textOf(kStatus)).value_or(ProbeStatus::Failed);
    return line;
}

} // namespace

ReportReader::ReportReader(const QString &file)
    : m_file(file)
    , m_read(QFileInfo(file).size())
{}

std::vector<ReportLine> ReportReader::takeNewLines()
{
    std::vector<ReportLine> lines;
    QFile file(m_file);
    if (m_file.isEmpty() || !file.open(QIODevice::ReadOnly) || !file.seek(m_read))
        return lines;
    const QByteArray news = file.readAll();
    m_read += news.size();
    m_rest += news;
    int from = 0;
    for (int end = m_rest.indexOf('\n'); end >= 0; end = m_rest.indexOf('\n', from)) {
        lines.push_back(lineOf(m_rest.mid(from, end - from)));
        from = end + 1;
    }
    m_rest.remove(0, from);
    return lines;
}
