#include "Core/BaseLib/Files/FileFinder.h"

#include "Core/BaseLib/Files/AnswerInTime.h"
#include "Core/BaseLib/Files/FolderListing.h"
#include "Core/BaseLib/Files/NativeFile.h"
#include "Core/BaseLib/Log/DebugLog.h"

#include <QDir>
#include <QFileInfo>

#include <algorithm>
#include <condition_variable>
#include <exception>
#include <iterator>
#include <mutex>
#include <set>
#include <thread>

namespace {

/// Why there is nothing to search; empty for a folder.
QString reasonAgainst(const QFileInfo &folder)
{
    if (!folder.exists())
        return QStringLiteral("it does not exist");
    if (!folder.isDir())
        return QStringLiteral("it is not a folder");
    return QString();
}

/// The folders that have been reported as unsearchable.
struct Reports {
    std::mutex mutex;
    std::set<QString> folders;
};

Reports &reports()
{
    static Reports instance;
    return instance;
}

void logUnsearchable(const QString &folder, const QString &reason)
{
    const std::lock_guard<std::mutex> lock(reports().mutex);
    if (reports().folders.insert(folder).second)
        DebugLog(L"Cannot search the folder \"%ls\": %ls", folder, reason);
}

constexpr std::chrono::seconds kTold(1); ///< between two words on a folder that gives no answer
constexpr std::chrono::milliseconds kLook(50);

/// Whether one of some folders is this one or lies in it.
bool isAroundAny(const QString &path, const QStringList &folders)
{
    return std::any_of(folders.begin(), folders.end(),
                       [&](const QString &folder) { return isBelow(folder, path); });
}

/// What a path becomes when the folder at its start is reached by another one.
QString moved(const QString &path, const QString &from, const QString &to)
{
    if (from == to)
        return path;
    const auto withoutSlash = [](const QString &folder) {
        return folder.endsWith(QLatin1Char('/')) ? folder.chopped(1) : folder;
    };
    return withoutSlash(to) + path.mid(withoutSlash(from).size());
}

} // namespace

/// A search on a thread of its own, seen by the one that waits for it. Whoever gave up does not look at the
/// finder any more.
struct FileFinder::Watch {
    explicit Watch(const FileFinder &of)
        : finder(of)
    {}

    std::mutex mutex; ///< guards what follows, but the finder and its answer until `isDone`
    std::condition_variable done;
    QString atHand; ///< what the system is asked about
    std::chrono::steady_clock::time_point since;
    bool isDone = false;
    bool isGivenUp = false;
    FileFinder finder;
    bool isWhole = false;
    std::exception_ptr thrown; ///< by the search, for whoever waits
};

FileFinder::FileFinder(const QStringList &endings, Links links, IsPart isPart)
    : m_endings(endings)
    , m_links(links)
    , m_isPart(isPart)
{}

void FileFinder::forgetReports()
{
    const std::lock_guard<std::mutex> lock(reports().mutex);
    reports().folders.clear();
}

QStringList FileFinder::find(const QStringList &folders, const QString &ending, const Cancelled &isCancelled)
{
    const bool isWhole =
        (!folders.isEmpty() && folders == m_folders) || searchPatiently(folders, isCancelled);
    m_folders = isWhole ? folders : QStringList();
    QStringList paths;
    std::copy_if(m_found.begin(), m_found.end(), std::back_inserter(paths),
                 [&](const QString &path) { return path.endsWith(ending, Qt::CaseInsensitive); });
    return paths;
}

void FileFinder::setArea(const SearchArea &area)
{
    m_area = area;
    m_folders.clear(); // what was found does not count any more
}

QString FileFinder::foundInsteadOf(const QString &path) const
{
    const QString known = knownByLink(path);
    if (m_foundKeys.contains(pathKey(known)))
        return known;
    // There may be further links behind this one, or one where this search did not look.
    const std::optional<QString> real =
        (!known.isNull() || m_area.isLimited()) && fileAnswers(path) ? realPath(path) : std::nullopt;
    return real ? knownAs({path, *real}) : known;
}

/// The same as one link tells it, without asking the system: the one that leads to the longest part of the
/// path.
QString FileFinder::knownByLink(const QString &path) const
{
    const Place *longest = nullptr;
    for (const Place &other : m_otherPaths)
        if (isBelow(path, other.path) && (!longest || other.path.size() > longest->path.size()))
            longest = &other;
    return longest ? knownAs({path, moved(path, longest->path, longest->real)}) : QString();
}

/// The path under which what lies at a place was listed, or would have been.
QString FileFinder::knownAs(const Place &place) const
{
    const auto listed = m_listedByLink.constFind(listedKey(place.real, place.path));
    return listed != m_listedByLink.constEnd() ? *listed : searchedAs(place.real);
}

/// The finder's ending that a name or a path has; null when it has none. What is called like an ending and no
/// more is a folder for such files: "~/.vst3".
QString FileFinder::endingOf(const QString &path) const
{
    const int length = path.size() - (path.lastIndexOf(QLatin1Char('/')) + 1);
    const auto ending = std::find_if(m_endings.begin(), m_endings.end(), [&](const QString &each) {
        return length > each.size() && path.endsWith(each, Qt::CaseInsensitive);
    });
    return ending == m_endings.end() ? QString() : *ending;
}

bool FileFinder::isLookedFor(const QString &path) const { return !endingOf(path).isNull(); }

/// A file is one for each ending: makers install one file for several formats, and link to it by as many
/// names.
QString FileFinder::listedKey(const QString &real, const QString &path) const
{
    return pathKey(real) + QLatin1Char('\n') + endingOf(path);
}

void FileFinder::setPatience(std::chrono::seconds limit, Waiting waiting)
{
    m_limit = limit;
    m_waiting = std::move(waiting);
}

std::vector<FileFinder::Problem> FileFinder::takeProblems()
{
    std::vector<Problem> problems;
    problems.swap(m_problems);
    return problems;
}

void FileFinder::addProblem(const QString &path, const QString &reason)
{
    if (!reason.isEmpty())
        m_problems.push_back({path, reason});
}

/// Whether a path gave no answer before. Else whoever waits hears that it is asked now.
bool FileFinder::isPassedOver(const QString &path)
{
    if (isBelowAny(path, m_silent))
        return true;
    if (m_watch) {
        const std::lock_guard<std::mutex> lock(m_watch->mutex);
        m_watch->atHand = path;
        m_watch->since = std::chrono::steady_clock::now();
    }
    return false;
}

/// False when it ended early.
bool FileFinder::searchPatiently(const QStringList &folders, const Cancelled &isCancelled)
{
    bool isWhole = false;
    if (!m_waiting) {
        isWhole = search(folders, isCancelled);
    } else {
        m_silent.clear();
        for (bool isOver = false; !isOver;) {
            const auto watch = std::make_shared<Watch>(*this);
            watch->since = std::chrono::steady_clock::now();
            std::thread thread([watch, folders] {
                watch->finder.m_watch = watch;
                const auto isGivenUp = [&watch] {
                    const std::lock_guard<std::mutex> lock(watch->mutex);
                    return watch->isGivenUp;
                };
                bool isFound = false;
                try {
                    isFound = watch->finder.search(folders, isGivenUp);
                } catch (...) {
                    watch->thrown = std::current_exception();
                }
                watch->finder.m_watch.reset();
                const std::lock_guard<std::mutex> lock(watch->mutex);
                watch->isWhole = isFound;
                watch->isDone = true;
                watch->done.notify_all();
            });
            if (waitFor(watch, isCancelled)) {
                thread.join();
                if (watch->thrown)
                    std::rethrow_exception(watch->thrown);
                *this = watch->finder;
                isWhole = watch->isWhole && !(isCancelled && isCancelled());
                isOver = true;
            } else { // it ends when the system answers, and nobody asks for what it found
                leaveBehind(std::move(thread));
                isOver = isCancelled && isCancelled();
            }
        }
    }
    for (const QString &path : m_silent) {
        m_unread.append(path);
        addProblem(path, QStringLiteral("it gave no answer for %1 s").arg(m_limit.count()));
    }
    for (const Problem &problem : m_problems)
        logUnsearchable(problem.path, problem.reason);
    return isWhole;
}

/// Waits for a search. False when it was given up: somebody cancelled, or the path at hand gave no answer,
/// which is noted.
bool FileFinder::waitFor(const std::shared_ptr<Watch> &watch, const Cancelled &isCancelled)
{
    auto told = std::chrono::steady_clock::now();
    std::unique_lock<std::mutex> lock(watch->mutex);
    while (!watch->done.wait_for(lock, kLook, [&] { return watch->isDone; })) {
        const auto now = std::chrono::steady_clock::now();
        const bool isSilent = m_limit.count() > 0 && now - watch->since >= m_limit;
        const bool isSlow = now - std::max(watch->since, told) >= kTold;
        const QString atHand = watch->atHand;
        lock.unlock(); // others' code follows
        const bool isOver = isSilent || (isCancelled && isCancelled());
        if (isSlow && !isOver) {
            m_waiting(atHand);
            told = now;
        }
        lock.lock();
        if (isOver && !watch->isDone) {
            watch->isGivenUp = true;
            if (isSilent)
                m_silent.append(atHand);
            return false;
        }
    }
    return true;
}

/// False when it ended early.
bool FileFinder::search(const QStringList &folders, const Cancelled &isCancelled)
{
    FileFinder fresh(m_endings, m_links, m_isPart);
    fresh.m_area = m_area;
    fresh.m_limit = m_limit;
    fresh.m_waiting = m_waiting;
    fresh.m_watch = m_watch;
    fresh.m_silent = m_silent;
    *this = std::move(fresh);
    const std::vector<Place> starts = settleStarts(folders);
    listStarts(starts);
    for (const Place &start : starts)
        if (mayHoldSome(start, start.path) && !isListedFile(start) &&
            !searchFolder(start, start.path, isCancelled))
            return false;
    for (std::size_t index = 0; index < m_met.size(); ++index) { // following one adds others
        const Link link = m_met[index];
        if (!follow(link, isCancelled))
            return false;
    }
    if (hasOtherPaths())
        for (const QString &path : m_found)
            m_foundKeys.insert(pathKey(path));
    return true;
}

/// The folders to search, each real one once.
std::vector<FileFinder::Place> FileFinder::settleStarts(const QStringList &folders)
{
    std::vector<Place> starts;
    for (const QString &folder : folders) {
        if (folder.isEmpty()) { // made absolute, it would be the working folder
            addProblem(folder, QStringLiteral("no folder is given"));
            continue;
        }
        const QString path = QDir::cleanPath(QFileInfo(folder).absoluteFilePath());
        if (m_area.isExcluded(path) || isPassedOver(path))
            continue;
        if (!m_area.mayHoldSome(path) && !answers(path)) // nobody waits long for a folder that was not named
            continue;
        const Place start{path, realPath(path).value_or(path)};
        if (!mayHoldSome(start, path)) { // a link in the area may lead there
            m_realOthers.append(start.real);
            continue;
        }
        const QString before = searchedAs(start.real);
        if (before.isNull()) {
            m_starts.insert(pathKey(start.real), path);
            starts.push_back(start);
        } else if (!isSamePath(before, path)) {
            m_otherPaths.push_back(start);
        }
    }
    for (const Place &start : starts) {
        m_realFolders.append(start.real);
        const bool isMet = std::any_of(starts.begin(), starts.end(), [&](const Place &other) {
            return &other != &start && isBelow(start.real, other.real);
        });
        if (isMet)
            m_startsMet.insert(pathKey(start.real), start.path);
    }
    return starts;
}

/// Lists the folders to search that are looked for themselves, before the searches come upon them.
void FileFinder::listStarts(const std::vector<Place> &starts)
{
    for (const Place &start : starts)
        if (isLookedFor(start.path) && isInArea(start, start.path) && QFileInfo::exists(start.path)) {
            m_found.append(start.path);
            m_listedByLink.insert(listedKey(start.real, start.path), start.path);
        }
}

/// Whether a start is a file that was listed, in which there is nothing to search.
bool FileFinder::isListedFile(const Place &start) const
{
    return m_listedByLink.contains(listedKey(start.real, start.path)) && QFileInfo(start.path).isFile();
}

/// Whether something below a start belongs to what is searched.
bool FileFinder::isInArea(const Place &start, const QString &path) const
{
    if (m_area.isEverything())
        return true;
    const QString real = moved(path, start.path, start.real);
    return (m_area.isWithin(path) || m_area.isWithin(real)) && !m_area.isExcluded(path) &&
           !m_area.isExcluded(real);
}

/// Whether something that belongs to what is searched may lie in a folder below a start. What a link in the
/// area leads to lies elsewhere, and what leads into the area may be a link outside it.
bool FileFinder::mayHoldSome(const Place &start, const QString &folder) const
{
    if (m_area.isEverything())
        return true;
    const QString real = moved(folder, start.path, start.real);
    return !m_area.isExcluded(folder) && !m_area.isExcluded(real) &&
           (m_area.mayHoldSome(folder) || m_area.mayHoldSome(real));
}

/// False when it ended early.
bool FileFinder::searchFolder(const Place &start, const QString &folder, const Cancelled &isCancelled)
{
    if (isCancelled && isCancelled())
        return false;
    if (isPassedOver(folder))
        return true;
    const QString prefix = folder.endsWith(QLatin1Char('/')) ? folder : folder + QLatin1Char('/');
    const FolderContent content =
        listFolder(folder, [&](const QString &name) { return !isPassedOver(prefix + name); });
    if (!content.problem.isEmpty()) {
        m_unread.append(folder);
        addProblem(folder, content.problem);
    } else if (content.entries.empty()) {
        addProblem(folder, reasonAgainst(QFileInfo(folder)));
    }
    for (const FolderEntry &entry : content.unnamed)
        if (entry.isFolder || isLookedFor(entry.name))
            addProblem(prefix + entry.name, QStringLiteral("its name is not valid text"));
    for (const FolderEntry &entry : content.entries) {
        if (entry.isLink && m_links == Links::Followed)
            m_met.push_back({prefix + entry.name, entry.isFolder});
        else if (isLookedFor(entry.name))
            listEntry(start, prefix + entry.name);
    }
    for (const FolderEntry &entry : content.entries) {
        if (!entry.isFolder || entry.isLink)
            continue;
        const Place place{prefix + entry.name, moved(prefix + entry.name, start.path, start.real)};
        if (mayHoldSome(start, place.path) && !wasReached(m_startsMet, pathKey(place.real), place) &&
            !searchFolder(start, place.path, isCancelled))
            return false;
    }
    return true;
}

/// Lists what is looked for below a start, unless it was listed before.
void FileFinder::listEntry(const Place &start, const QString &path)
{
    const Place place{path, moved(path, start.path, start.real)};
    if (!isInArea(start, path) || isPartOfOther(path) || (place.real != path && isPartOfOther(place.real)))
        return;
    if (m_listedByLink.isEmpty() || !wasReached(m_listedByLink, listedKey(place.real, path), place))
        m_found.append(path);
}

/// Whether something was reached by another path, which is noted.
bool FileFinder::wasReached(const Reached &reached, const QString &key, const Place &place)
{
    const auto found = reached.constFind(key);
    if (found == reached.constEnd())
        return false;
    if (!isSamePath(*found, place.path))
        m_otherPaths.push_back(place);
    return true;
}

/// Searches the folder that a link leads to, and lists what is looked for. False when it ended early.
bool FileFinder::follow(const Link &link, const Cancelled &isCancelled)
{
    if (isPassedOver(link.path))
        return true;
    const std::optional<QString> real = realPath(link.path);
    if (!real)
        return true;
    const Place place{link.path, *real};
    if (isAroundAny(place.real, m_realFolders)) { // it is searched by its own path
        if (!searchedAs(place.real).isNull())
            m_otherPaths.push_back(place);
        return true;
    }
    if (isAroundAny(place.real, m_realOthers) && !m_realOthers.contains(place.real, kPathCase))
        return true;
    if (!mayHoldSome(place, link.path))
        return true;
    const bool isNew = searchedInAreaAs(place.real).isNull();
    const QString key = listedKey(place.real, link.path);
    if (!isNew || m_listedByLink.contains(key))
        m_otherPaths.push_back(place);
    if (isLookedFor(link.path) && !isPartOfOther(link.path) && !isListed(place) &&
        isInArea(place, link.path)) {
        m_found.append(link.path);
        m_listedByLink.insert(key, link.path);
    }
    if (!link.isToFolder || !isNew)
        return true;
    m_starts.insert(pathKey(place.real), link.path);
    m_startsMet.insert(pathKey(place.real), link.path);
    return searchFolder(place, place.path, isCancelled);
}

/// Whether what a link leads to was listed. Where it has another ending than the link, or is part of
/// something else there, it was not, although its folder was searched.
bool FileFinder::isListed(const Place &place) const
{
    if (m_listedByLink.contains(listedKey(place.real, place.path)))
        return true;
    const QString before = searchedInAreaAs(place.real);
    return endingOf(before) == endingOf(place.path) && !isPartOfOther(before);
}

/// The path under which the search of some start comes upon a real file or folder; null when none does.
QString FileFinder::searchedAs(const QString &real) const
{
    for (QString part = real; !m_starts.isEmpty(); part.truncate(part.lastIndexOf(QLatin1Char('/')))) {
        const auto start = m_starts.constFind(pathKey(part));
        if (start != m_starts.constEnd())
            return moved(real, part, *start);
        if (!part.contains(QLatin1Char('/')) || QFileInfo(part).isHidden())
            break;
    }
    return {};
}

/// The same where it belongs to what is searched: what lies elsewhere below a start is not come upon.
QString FileFinder::searchedInAreaAs(const QString &real) const
{
    const QString path = searchedAs(real);
    return m_area.isWithin(path) || m_area.isWithin(real) ? path : QString();
}

QStringList findFiles(const QString &folder, const QString &ending, FileFinder::Links links)
{
    return FileFinder({ending}, links).find({folder}, ending);
}
