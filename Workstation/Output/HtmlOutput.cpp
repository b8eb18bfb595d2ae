#include "Core/BaseLib/Binary/LoadFailure.h"
#include "Workstation/Options/PluginFolders.h"
#include "Workstation/Output/FailureText.h"
#include "Workstation/Output/SummaryOutput.h"
#include "Workstation/Output/Terminal.h"

#include <QCryptographicHash>
#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QJsonArray>

#include <kainjow/mustache.hpp>

#include <algorithm>
#include <cmath>

/// A static library's resources are there when somebody asks for them.
static void initialisePage() { Q_INIT_RESOURCE(page); }

namespace {

namespace mustache = kainjow::mustache;

// The picture, in its own units.
constexpr double kWidth = 1000;
constexpr double kLeft = 70; ///< where time begins; labels lie before it
constexpr double kRight = kWidth - 15;
constexpr double kRow = 28;
constexpr double kBar = 22;
constexpr double kPart = 8;
constexpr double kLeastBar = 1.5;
constexpr double kAxis = 20;
constexpr double kShareWidth = 160;
constexpr std::size_t kSlow = 10;

QByteArray resource(const char *name)
{
    QFile file(QStringLiteral(":/page/") + QLatin1String(name));
    file.open(QIODevice::ReadOnly);
    return file.readAll();
}

/// As a policy names what it allows.
QString hashOf(const QByteArray &text)
{
    return QString::fromLatin1(QCryptographicHash::hash(text, QCryptographicHash::Sha256).toBase64());
}

/// What a template takes; it escapes texts by itself.
mustache::data dataOf(const QJsonValue &value)
{
    if (value.isBool())
        return value.toBool();
    if (value.isArray()) {
        mustache::data list(mustache::data::type::list);
        for (const QJsonValue each : value.toArray())
            list << dataOf(each);
        return list;
    }
    if (value.isObject()) {
        mustache::data object;
        const QJsonObject members = value.toObject();
        for (auto member = members.begin(); member != members.end(); ++member)
            object.set(member.key().toStdString(), dataOf(member.value()));
        return object;
    }
    return value.isDouble() ? QString::number(value.toDouble()).toStdString()
                            : Terminal::harmless(value.toString()).toStdString();
}

struct Advice {
    QString text;
    QString option; ///< of fxscan, with its value; empty: none helps
};

/// Why asking again alone is in vain: how the reason begins, and what helps.
struct Remedy {
    const char *reason;
    const char *text;
    bool asksAgain; ///< by the user; else the next scan does so
};

constexpr Remedy kRemedies[] = {
    {kNeedsLibrary, "Install what it needs. Then, to ask it again:", true},
    {kBuiltFor, "Only another build of it can help. It is asked again when its file changes.", false},
    {kBundleFor, "Only another build of it can help. The next scan looks at it again.", false},
    {kBundleHas, "Copy or install it anew. The next scan looks at it again.", false},
    {kBundleClosed, "Let yourself read the folder. The next scan looks at it again.", false},
    {kUnopened, "Let yourself read the file. The next scan looks at it again.", false},
    {kCutShort, "Copy or install it anew. The next scan looks at it again.", false},
    {kEmptyFile, "Copy or install it anew. The next scan looks at it again.", false},
};

Advice adviceFor(const PluginFailure &failure)
{
    // A sub-plug-in shares its path with its siblings.
    const QString name = QLatin1Char('=') + shellWord(failure.subId != 0 ? failure.name : failure.path);
    switch (failure.state) {
    case PluginState::Failed:
        for (const Remedy &remedy : kRemedies)
            if (failure.reason.startsWith(QLatin1String(remedy.reason)))
                return {QLatin1String(remedy.text),
                        remedy.asksAgain ? QStringLiteral("--retry") + name : QString()};
        return {QStringLiteral("It is asked again when its file changes. To ask it now:"),
                QStringLiteral("--retry") + name};
    case PluginState::Disabled:
        if (failure.hasChanged)
            return {QStringLiteral("Its file has changed since it crashed. To ask it again:"),
                    QStringLiteral("--retry") + name};
        return {QStringLiteral("It is not loaded again until you ask for it, best after an update:"),
                QStringLiteral("--retry") + name};
    case PluginState::SwitchedOff:
        return {QStringLiteral("It was switched off. To have it back:"),
                QStringLiteral("--switch-on") + name};
    case PluginState::FolderAway:
        return {QStringLiteral("Connect its drive and scan again. If it is gone for good:"),
                QStringLiteral("--forget=") + shellWord(QFileInfo(failure.path).path())};
    case PluginState::FileGone:
        return {QStringLiteral("A scan of all folders finds it where it is now, or lets it go."), QString()};
    case PluginState::NotAsked:
        return {QStringLiteral("The next scan asks it."), QString()};
    case PluginState::Skipped:
        return {QStringLiteral("The next scan asks it again."), QString()};
    default:
        return {};
    }
}

/// Replaces each object of an array by what the operation makes of it and its place.
template <typename Operation>
void decorate(QJsonObject &page, const char *name, Operation operation)
{
    QJsonArray array = page.value(QLatin1String(name)).toArray();
    for (int index = 0; index < array.size(); ++index) {
        QJsonObject object = array.at(index).toObject();
        if (const PluginFormatInfo *format = formatOfKey(object.value(QStringLiteral("format")).toString()))
            object.insert(QStringLiteral("formatTitle"), QLatin1String(format->title));
        QString state = object.value(QStringLiteral("state")).toString();
        object.insert(QStringLiteral("stateClass"),
                      QStringLiteral("s-") + state.replace(QLatin1Char(' '), QLatin1Char('-')));
        operation(object, static_cast<std::size_t>(index));
        array.replace(index, object);
    }
    page.insert(QLatin1String(name), array);
}

QString labelOf(const std::optional<ProbeStatus> &status)
{
    return status ? QString::fromLatin1(statusText(*status)) : QStringLiteral("asked again");
}

QString classOf(const std::optional<ProbeStatus> &status)
{
    return QStringLiteral("b-") + labelOf(status).replace(QLatin1Char(' '), QLatin1Char('-'));
}

QString seconds(double milliseconds) { return QString::number(milliseconds / 1000, 'f', 1); }

/// Seconds between two lines of the picture: 1, 2 or 5 of some power of ten, at most eight times.
double tickStep(double duration)
{
    const double power = std::pow(10, std::floor(std::log10(duration / 8)));
    for (const double step : {power, 2 * power, 5 * power})
        if (duration / step <= 8)
            return step;
    return 10 * power;
}

/// Places of the picture's parts.
class Picture {
public:
    explicit Picture(const ScanTimeline &timeline)
        : m_timeline(timeline)
        , m_duration(std::max(timeline.milliseconds, 1.0))
        , m_bottom(static_cast<double>(timeline.rows) * kRow)
    {}

    void addTo(QJsonObject &page) const
    {
        page.insert(QStringLiteral("width"), kWidth);
        page.insert(QStringLiteral("height"), m_bottom + kAxis);
        page.insert(QStringLiteral("bottom"), m_bottom);
        page.insert(QStringLiteral("textY"), m_bottom + kAxis - 5);
        page.insert(QStringLiteral("ticks"), ticks());
        page.insert(QStringLiteral("rows"), rows());
        page.insert(QStringLiteral("bars"), bars());
    }

private:
    double at(double time) const { return kLeft + (kRight - kLeft) * std::min(time / m_duration, 1.0); }

    QJsonArray ticks() const
    {
        QJsonArray ticks;
        const double whole = m_duration / 1000; // s
        const double step = tickStep(whole);
        for (int tick = 0; tick * step <= whole; ++tick)
            ticks.append(QJsonObject{{QStringLiteral("x"), at(tick * step * 1000)},
                                     {QStringLiteral("text"), QStringLiteral("%1 s").arg(tick * step)}});
        return ticks;
    }

    QJsonArray rows() const
    {
        QJsonArray rows;
        for (std::size_t row = 0; row < m_timeline.rows; ++row)
            rows.append(QJsonObject{{QStringLiteral("y"), static_cast<double>(row) * kRow + 16},
                                    {QStringLiteral("text"), QStringLiteral("Worker %1").arg(row + 1)}});
        return rows;
    }

    QJsonArray bars() const
    {
        QJsonArray bars;
        for (const TimelineBar &bar : m_timeline.bars) {
            const double height = bar.isPart ? kPart : kBar;
            const double begin = at(bar.begin);
            bars.append(
                QJsonObject{{QStringLiteral("class"), classOf(bar.status)},
                            {QStringLiteral("x"), begin},
                            {QStringLiteral("y"), static_cast<double>(bar.row) * kRow + kBar - height + 1},
                            {QStringLiteral("width"), std::max(at(bar.end) - begin, kLeastBar)},
                            {QStringLiteral("height"), height},
                            {QStringLiteral("title"), titleOf(bar)}});
        }
        return bars;
    }

    static QString titleOf(const TimelineBar &bar)
    {
        const QString reason = bar.reason.isEmpty() ? QString() : QStringLiteral(": ") + bar.reason;
        return QStringLiteral("%1, %2 s, %3%4")
            .arg(bar.name, seconds(bar.end - bar.begin), labelOf(bar.status), reason);
    }

    const ScanTimeline &m_timeline;
    double m_duration; ///< ms
    double m_bottom;   ///< of the rows
};

/// How the attempts ended, how many and how long, and the files that took longest.
void addTimes(QJsonObject &page, const ScanTimeline &timeline)
{
    struct Sum {
        int count = 0;
        double time = 0;
    };
    std::map<std::optional<ProbeStatus>, Sum> sums;
    std::map<QString, double> times; // ms, of files; some are asked twice
    int probes = 0;
    double all = 0; // ms
    for (const TimelineBar &bar : timeline.bars) {
        if (bar.isPart)
            continue;
        ++probes;
        times[bar.path] += bar.end - bar.begin;
        Sum &sum = sums[bar.status];
        ++sum.count;
        sum.time += bar.end - bar.begin;
        all += bar.end - bar.begin;
    }
    QJsonArray statuses;
    for (const auto &[status, sum] : sums)
        statuses.append(QJsonObject{{QStringLiteral("class"), classOf(status)},
                                    {QStringLiteral("label"), labelOf(status)},
                                    {QStringLiteral("count"), sum.count},
                                    {QStringLiteral("seconds"), seconds(sum.time)}});
    std::vector<std::pair<QString, double>> files(times.begin(), times.end());
    std::stable_sort(files.begin(), files.end(),
                     [](const auto &a, const auto &b) { return a.second > b.second; });
    files.resize(std::min(kSlow, files.size()));
    QJsonArray slow;
    for (const auto &[path, time] : files) {
        const double share = all > 0 ? time / all : 0;
        slow.append(QJsonObject{{QStringLiteral("name"), fileNameOf(path)},
                                {QStringLiteral("milliseconds"), QString::number(time, 'f', 0)},
                                {QStringLiteral("share"), share * kShareWidth},
                                {QStringLiteral("percent"), QString::number(share * 100, 'f', 0)}});
    }
    page.insert(QStringLiteral("statuses"), statuses);
    page.insert(QStringLiteral("slow"), slow);
    page.insert(QStringLiteral("timeText"),
                QStringLiteral("The scan took %1 s; %2 probe%3 took %4 s together, up to %5 at once.")
                    .arg(seconds(timeline.milliseconds))
                    .arg(probes)
                    .arg(QLatin1String(probes == 1 ? "" : "s"))
                    .arg(seconds(all))
                    .arg(timeline.rows));
}

} // namespace

QByteArray renderHtml(const ScanSummary &summary, const QString &dataFolder, const QStringList &folders)
{
    initialisePage();
    const QByteArray style = resource("page.css");
    const QByteArray script = resource("page.js");
    QJsonObject page = summaryObject(summary, dataFolder, folders);
    decorate(page, "plugins", [&](QJsonObject &object, std::size_t index) {
        object.insert(QStringLiteral("categoryText"),
                      summary.plugins[index].categories().join(QLatin1String(", ")));
    });
    const QString command = dataFolder == userDataFolder()
                                ? QStringLiteral("fxscan ")
                                : QStringLiteral("fxscan --data-folder=%1 ").arg(shellWord(dataFolder));
    decorate(page, "failures", [&](QJsonObject &object, std::size_t index) {
        const Advice advice = adviceFor(summary.failures[index]);
        object.insert(QStringLiteral("help"), advice.text);
        object.insert(QStringLiteral("hasCommand"), !advice.option.isEmpty());
        object.insert(QStringLiteral("command"), command + advice.option);
    });
    decorate(page, "duplicates", [](QJsonObject &duplicate, std::size_t) {
        decorate(duplicate, "members", [](QJsonObject &member, std::size_t) {
            const QString why = member.value(QStringLiteral("reason")).toString();
            member.insert(QStringLiteral("usage"), member.value(QStringLiteral("used")).toBool()
                                                       ? QStringLiteral("used")
                                                       : QStringLiteral("not used, ") + why);
        });
    });
    Picture(summary.timeline).addTo(page);
    addTimes(page, summary.timeline);
    const QString now = QDateTime::currentDateTime().toString(QStringLiteral("yyyy-MM-dd hh:mm"));
    page.insert(QStringLiteral("counts"), renderCounts(summary).trimmed());
    page.insert(QStringLiteral("when"), now);
    page.insert(QStringLiteral("hasFolders"), summary.isScan);
    page.insert(QStringLiteral("hasFailures"), !summary.failures.empty());
    page.insert(QStringLiteral("hasDuplicates"), !summary.duplicates.empty());
    page.insert(QStringLiteral("hasNoPlugins"), !summary.noPlugins.empty());
    page.insert(QStringLiteral("isUnfinished"), summary.isScan && !summary.finished);
    page.insert(QStringLiteral("hasTimeline"), summary.isScan);
    page.insert(QStringLiteral("hasBars"), !summary.timeline.bars.empty());
    page.insert(QStringLiteral("styleHash"), hashOf(style));
    page.insert(QStringLiteral("scriptHash"), hashOf(script));
    mustache::data data = dataOf(page);
    data.set("style", style.toStdString()); // not ours to change: their hashes allow them
    data.set("script", script.toStdString());
    mustache::mustache filled(resource("page.html").toStdString());
    return QByteArray::fromStdString(filled.render(data));
}
