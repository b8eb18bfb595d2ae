#include "Main/AudioEngineController/Effects/CLAP/CLAPHost.h"
#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Host.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestFolder.h"

#include <QDir>
#include <QFileInfo>
#include <QRegularExpression>

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <set>

// Random histories of a few files, checked against the rules: a mark leaves only with its plug-in, a culprit
// stays a culprit, no identifier twice, no dead path but below a folder that is away. A plug-in has a number,
// which is also the bit of the only category that a user gives it, so that a mark that strays is seen.

namespace {

constexpr int kProducts = 6; ///< three bear each file name
constexpr int kPerProduct = 4;
constexpr int kSteps = 9;
constexpr int kSeedsInMemory = 250; ///< of each block
constexpr int kSeedsOnDisk = 10;
constexpr int kBlocks = 5; ///< of each format
constexpr char kMemoryFolder[] = "/dev/shm";

enum class Way { Lists, Fails, HalfWritten, Kills };
enum class Ending { Whole, Cancelled, Terminated, Killed, OutOfMemory };
using Numbers = std::set<int>;                ///< of plug-ins
using Mark = std::tuple<quint32, bool, bool>; ///< category, favourite, switched off

Mark markOf(const EffectRecord &record)
{
    return {record.category, record.favourite, record.isSwitchedOff()};
}

struct File {
    int product = 0;
    int version = 0;
    Way way = Way::Lists;
    Numbers offers;
    int deadly = -1;     ///< the sub-plug-in that kills the process
    Numbers kept;        ///< what the last whole scan listed under its path
    int keptVersion = 0; ///< as of then
};

struct ProcessEnded {};

/// The files, what probes of them come to, and what the user did.
class World {
public:
    World(PluginFormat format, unsigned seed)
        : m_info(formatInfo(format))
        , m_random(seed)
    {
        for (const char *folder : {"a", "b", "c"})
            m_folder.write(QString("Plugins/%1/read.me").arg(folder), "keeps the folder from being empty");
    }

    void play()
    {
        for (int step = 0; step < kSteps && !testing::Test::HasFailure(); ++step) {
            history << QString("step %1").arg(step);
            noteAsleep();
            if (!m_isSettled)
                doubtDropped();
            for (int count = 1 + pick(3); count > 0; --count)
                change();
            if (m_isSettled && step % 3 == 1)
                scanPart();
            m_isSettled = scan();
            history << catalogueText();
            if (!m_isSettled || testing::Test::HasFailure())
                continue;
            checkAll();
            m_unsure.clear();
            m_crashed.clear();
            m_left.clear();
            const QByteArray before = catalogueText();
            EXPECT_TRUE(runOnce());
            if (catalogueText() != before)
                checkNames(before);
            mark();
        }
    }
    QStringList history;

    // What the hosts ask.
    QString folder() const { return m_folder.effects(); }
    QString plugins() const { return m_folder.plugins(); }
    void allocate()
    {
        if (m_ending != Ending::OutOfMemory || --m_countdown != 0)
            return;
        history << "    out of memory";
        doubtDropped();
        m_hasFailed = true;
        throw std::bad_alloc();
    }
    QString stampOf(const QString &path) const
    {
        return m_files.count(path) ? QString("version %1").arg(m_files.at(path).version) : QString();
    }
    ProbeOutcome probe(const ProbeJob &job, IProbeObserver &observer)
    {
        const File &file = m_files.at(job.path);
        EXPECT_FALSE(m_culprits.count(job.path)) << "loads the culprit " << qPrintable(job.path);
        observer.stageEntered(ProbeStage::Load);
        reach(job.path, file.product * kPerProduct, file.way == Way::Kills);
        ProbeOutcome outcome;
        if (file.way == Way::HalfWritten && !isVst2())
            outcome.ifFailed = ProbeOutcome::IfFailed::KeepKnown;
        if (file.way != Way::Lists)
            return outcome;
        outcome.status = ProbeStatus::Listed;
        for (const int number : file.offers) {
            EffectRecord record;
            record.path = job.path;
            record.fileTime = job.fileTime;
            record.name = nameOf(number);
            record.id = idOf(number);
            if (isShell(file.product)) {
                record.subId = static_cast<quint32>(number % kPerProduct);
                record.subName = record.name;
                probeChild(record, number, job.leftOut.count(record.subId) != 0, observer);
            }
            outcome.records.push_back(record);
        }
        return outcome;
    }

private:
    bool isVst2() const { return m_info.format == PluginFormat::Vst2; }
    bool isShell(int product) const { return isVst2() && product % 3 != 0; }
    int pick(int count) { return static_cast<int>(m_random() % static_cast<unsigned>(count)); }
    static QString nameOf(int number) { return QString("Plug-in %1").arg(number); }
    QString idOf(int number) const
    {
        if (m_info.format == PluginFormat::Clap) // any text: also what the file is called
            return number == 1 ? QString("A") : QString("com.example.%1").arg(number);
        return isVst2() ? QString("P:%1").arg(number) : QString("%1").arg(number, 32, 16, QChar('0'));
    }
    Numbers numbersOf(int product)
    {
        const int first = product * kPerProduct;
        Numbers numbers;
        for (int number = first + 1; number < first + kPerProduct; ++number)
            if (pick(3) != 0)
                numbers.insert(number);
        if (isVst2() && !isShell(product))
            return {first};
        return numbers.empty() ? Numbers{first + 1} : numbers;
    }
    QString childOf(const QString &path, int number) const
    {
        return QString("%1 %2 %3").arg(path).arg(number).arg(stampOf(path));
    }
    static bool isAway(const QString &path) { return !QFileInfo(path).dir().exists(); }
    bool isThere(const QString &path) const { return m_files.count(path) != 0 && !isAway(path); }
    bool isGood(const QString &path, const File &file) const
    {
        return file.way == Way::Lists && isThere(path) && !m_culprits.count(path) && !m_asleep.count(path);
    }
    template <typename Condition>
    int filesThat(Condition holds) const
    {
        const auto each = [&](const auto &entry) { return holds(entry.first, entry.second); };
        return static_cast<int>(std::count_if(m_files.begin(), m_files.end(), each));
    }
    bool isKeptByBad(int number) const
    {
        return filesThat(
            [&](auto &path, auto &file) { return !isGood(path, file) && file.kept.count(number); });
    }
    bool isOffered(int number) const
    {
        return filesThat(
            [&](auto &path, auto &file) { return isGood(path, file) && file.offers.count(number); });
    }
    /// Whether a file lists it, or one that does not list anything did.
    bool isHere(int number) const { return isKeptByBad(number) || isOffered(number); }
    QByteArray catalogueText() const { return m_folder.catalogue(m_info.catalogue->fileName); }
    std::vector<EffectRecord> catalogue() const
    {
        return readCatalogueFile(*m_info.catalogue, folder() + m_info.catalogue->fileName).records;
    }

    void probeChild(EffectRecord &record, int number, bool isLeftOut, IProbeObserver &observer)
    {
        const QString child = childOf(record.path, number);
        if (isLeftOut) { // killed here, or where the file lay before
            EXPECT_TRUE(m_deadly.count(fileNameOf(child))) << qPrintable(child);
            record.id.clear();
            record.enabled = record.working = false;
            return;
        }
        EXPECT_FALSE(m_culprits.count(child));
        observer.childBegins(record);
        reach(child, number, number == m_files[record.path].deadly);
        observer.childEnds(ProbeOutcome());
    }

    /// A moment of a probe: the process ends here when the plug-in kills it, or somebody else.
    void reach(const QString &culprit, int number, bool kills)
    {
        const bool isInterrupted =
            m_ending != Ending::Whole && m_ending != Ending::OutOfMemory && --m_countdown == 0;
        if (!kills && !isInterrupted)
            return;
        doubtDropped();
        if (!kills && m_ending == Ending::Cancelled)
            return m_host->cancel();
        const bool isBlamed = kills || m_ending == Ending::Killed;
        history << (isBlamed ? "    killed in " : "    ended in ") + culprit;
        for (const QFileInfo &file : QDir(folder()).entryInfoList(QDir::Files))
            if (isBlamed || file.suffix() == "xml" || file.suffix() == "json")
                m_frozen[file.filePath()] = m_folder.read(file.filePath());
        if (isBlamed) {
            m_culprits.insert(culprit);
            m_deadly.insert(fileNameOf(culprit));
            m_crashed.insert(number);
        }
        m_hasEnded = true;
        throw ProcessEnded();
    }
    /// What a file does not offer any more may be forgotten before its copy, or an update, comes to offer it;
    /// and what one that lists nothing held when a copy that has come to hold it goes.
    void doubtDropped()
    {
        for (const auto &[path, file] : m_files)
            for (const int number : file.kept)
                if (!file.offers.count(number) || (!isGood(path, file) && isOffered(number)))
                    m_unsure.insert(number);
    }

    /// One run of the scanner; false when it ended early.
    bool runOnce();
    /// False when the scan was interrupted and is left so.
    bool scan()
    {
        m_ending = pick(2) == 0 ? Ending::Whole : static_cast<Ending>(pick(5));
        m_countdown = 1 + pick(5);
        history << QString("  scan, ending %1 after %2").arg(int(m_ending)).arg(m_countdown);
        for (int run = 0; run < 30; ++run) {
            const bool isWhole = runOnce();
            const bool wasInterrupted = !isWhole && m_ending != Ending::Whole && m_countdown <= 0;
            if (isWhole || wasInterrupted)
                m_ending = Ending::Whole;
            if (isWhole || (wasInterrupted && pick(2) == 0))
                return isWhole;
        }
        ADD_FAILURE() << "the scan never settles";
        return false;
    }

    /// A scan of one folder changes nothing elsewhere, but that a plug-in that works takes an identifier from
    /// one that does not, and that a file takes over what was known of one that is not there. No mark is
    /// lost: what is gone may lie in another folder. As if it had never been: what follows sees none of it.
    void scanPart()
    {
        const std::vector<EffectRecord> before = catalogue();
        std::map<QString, QByteArray> content;
        for (const QFileInfo &file : QDir(folder()).entryInfoList(QDir::Files))
            content[file.filePath()] = m_folder.read(file.filePath());
        const auto state =
            std::make_tuple(m_random, m_files, m_deadly, m_culprits, m_unsure, m_crashed, m_ending);
        m_part = plugins() + '/' + QChar('a' + pick(3));
        history << "  scan of " + m_part;
        m_ending = Ending::Whole;
        for (int run = 0; run < 30 && !runOnce(); ++run)
            continue;
        const std::vector<EffectRecord> after = catalogue();
        std::set<QString> crashed;
        for (const EffectRecord &record : before)
            if (record.isCrashedFile())
                crashed.insert(record.path);
        for (EffectRecord record : before) {
            const auto isIt = [&](EffectRecord other) {
                other.name = record.name; // of two of one name, one that works takes it
                return other == record;
            };
            // What a user switched on beside what crashed is switched off again when it is read.
            const bool isMissing = m_files.count(record.path) == 0 || isAway(record.path);
            const bool mayGo = isBelow(record.path, m_part) || crashed.count(record.path) != 0 || isMissing ||
                               (!record.working && !record.standsForFile());
            const auto hasMarks = [&](const EffectRecord &other) {
                return other.category == record.category && other.favourite == record.favourite;
            };
            EXPECT_TRUE(!isMissing || markOf(record) == Mark() ||
                        std::any_of(after.begin(), after.end(), hasMarks))
                << "marks of " << qPrintable(record.path + ' ' + record.id) << catalogueText().constData();
            EXPECT_TRUE(mayGo || std::any_of(after.begin(), after.end(), isIt))
                << qPrintable(record.path + ' ' + record.id) << catalogueText().constData();
        }
        m_part.clear();
        std::tie(m_random, m_files, m_deadly, m_culprits, m_unsure, m_crashed, m_ending) = state;
        for (const QFileInfo &file : QDir(folder()).entryInfoList(QDir::Files))
            QFile::remove(file.filePath());
        for (const auto &[file, text] : content)
            m_folder.write(file, text);
    }

    /// Of two plug-ins of one name, one that works takes it back from one that crashed, and that is all.
    void checkNames(QString before)
    {
        static const QRegularExpression name("<Name>.*</Name>");
        const QByteArray again = catalogueText();
        EXPECT_TRUE(QString(again).remove(name) == before.remove(name))
            << "scanned again: " << again.constData();
        EXPECT_TRUE(runOnce());
        EXPECT_TRUE(catalogueText() == again) << "and again: " << catalogueText().constData();
    }

    /// -1 for a record that stands for a file.
    int numberOf(const EffectRecord &record) const
    {
        for (int number = 0; number < kProducts * kPerProduct; ++number)
            if (record.id == idOf(number) || record.id == nameOf(number))
                return number;
        const auto file = m_files.find(record.path);
        if (!isVst2() || file == m_files.end() || (isShell(file->second.product) && record.subId == 0))
            return -1;
        return file->second.product * kPerProduct + int(record.subId);
    }

    /// Of what a file that moved held, when a namesake that is new as well may have been given it.
    void doubtMoved()
    {
        for (const auto &[path, file] : m_files) {
            const QString &mine = path;
            if (m_culprits.count(path) && file.keptVersion < 0 && filesThat([&](auto &other, auto &held) {
                    return other != mine && fileNameOf(other) == fileNameOf(mine) && held.keptVersion <= 0;
                }))
                m_unsure.insert(file.kept.begin(), file.kept.end());
        }
    }

    void checkAll()
    {
        doubtMoved();
        const std::vector<EffectRecord> records = catalogue();
        for (const EffectRecord &record : records)
            if (isThere(record.path) && record.fileTime == stampOf(record.path))
                m_asleep.erase(record.path); // it was asked, as another file does not list the same any more
        std::map<int, EffectRecord> found;
        for (const EffectRecord &record : records) {
            SCOPED_TRACE(qPrintable(record.path + " " + record.id));
            const int number = numberOf(record);
            const bool isCulprit = m_culprits.count(record.path) != 0;
            EXPECT_TRUE(isThere(record.path) || isAway(record.path)) << "a dead path";
            EXPECT_FALSE(isCulprit && record.enabled && record.working) << "a culprit is offered";
            if (number < 0) { // of one that crashed, nobody knows what it would list
                EXPECT_TRUE(isCulprit || isAway(record.path) || markOf(record) == Mark() ||
                            mayReplace(0, markOf(record)))
                    << "marks of a file";
                continue;
            }
            const QString child = childOf(record.path, number);
            if (!record.working && m_deadly.count(fileNameOf(child)))
                m_culprits.insert(child); // it killed where the file lay before, and was left out
            const auto file = m_files.find(record.path);
            const bool isKnown = file != m_files.end();
            const bool isBetter =
                isKnown && file->second.kept.count(number) && found[number].id != idOf(number);
            if (record.id == idOf(number) || found.count(number) == 0 || isBetter)
                found[number] = record;
            EXPECT_FALSE(isKnown && isGood(record.path, file->second) && !file->second.offers.count(number))
                << "is not there any more";
        }
        for (const auto &[path, file] : m_files)
            for (const int number : isGood(path, file) ? file.offers : Numbers())
                checkOffered(path, file, number, found);
        std::map<int, Mark> marks;
        for (int number = 0; number < kProducts * kPerProduct; ++number) {
            SCOPED_TRACE(number);
            checkMark(number, found.count(number) ? &found[number] : nullptr);
            if (found.count(number))
                marks[number] = markOf(found[number]);
        }
        m_marks = marks;
        for (auto &[path, file] : m_files) {
            file.keptVersion = file.version;
            file.kept.clear();
            for (const auto &[number, record] : found)
                if (record.path == path)
                    file.kept.insert(number);
        }
    }
    void checkOffered(const QString &path, const File &file, int number, std::map<int, EffectRecord> &found)
    {
        SCOPED_TRACE(qPrintable(path + QString(" offers %1").arg(number)));
        if (filesThat([&](auto &other, auto &held) {
                return isThere(other) && !isGood(other, held) && held.kept.count(number);
            }))
            return;
        if (!file.kept.empty() && file.version == file.keptVersion && !file.kept.count(number)) {
            m_unsure.insert(number); // another file listed it, and this one is not asked
            return;
        }
        ASSERT_TRUE(found.count(number)) << "is lost";
        if (m_culprits.count(childOf(path, number)))
            return;
        const EffectRecord &record = found[number];
        EXPECT_TRUE(isThere(record.path) && isGood(record.path, m_files[record.path]))
            << qPrintable(record.path);
        EXPECT_EQ(record.working, !m_culprits.count(childOf(record.path, number)));
    }
    void checkMark(int number, const EffectRecord *record)
    {
        const bool wasThere = m_marks.count(number) != 0;
        const bool isBad =
            isKeptByBad(number) || m_crashed.count(number) ||
            filesThat([&](auto &path, auto &) { return m_culprits.count(childOf(path, number)); });
        const bool hasCopies =
            filesThat([&](auto &, auto &file) { return file.product == number / kPerProduct; }) > 1;
        const bool isUnsure = m_unsure.count(number) || (isBad && hasCopies);
        const Mark wanted = wasThere ? m_marks.at(number) : Mark();
        const Mark shown = record ? markOf(*record) : Mark();
        Mark actual = shown;
        const bool isSameCategory = std::get<0>(actual) == std::get<0>(wanted);
        const bool isCulprit =
            record && (m_culprits.count(record->path) || m_culprits.count(childOf(record->path, number)));
        if (isSameCategory && (m_crashed.count(number) || isCulprit))
            std::get<2>(actual) = std::get<2>(wanted); // the crash takes the place of that
        if (wasThere && !isUnsure && isHere(number)) {
            EXPECT_TRUE(record) << "is lost with its marks";
            // One that killed keeps its own while a copy is listed, and shows them again when the copy goes.
            EXPECT_TRUE(actual == wanted || m_allMarks.count({number, shown}))
                << testing::PrintToString(actual) << " instead of " << testing::PrintToString(wanted);
            return;
        }
        const bool isAllowed = actual == Mark() || isSameCategory || std::get<0>(actual) == 1u << number ||
                               mayReplace(number % kPerProduct, actual) ||
                               (isAlone(number) && mayReplace(0, actual));
        EXPECT_TRUE(isAllowed) << "bears the mark " << std::get<0>(actual) << " of another";
    }
    /// Whether some file lists nothing else, so that it takes over what was known of the file.
    bool isAlone(int number) const
    {
        return filesThat([&](auto &, auto &file) { return file.offers == Numbers{number}; });
    }
    /// Whether a mark may have come from a plug-in that is gone: in VST 2 nothing but its place tells what
    /// took it.
    bool mayReplace(int place, const Mark &actual) const
    {
        const auto isIts = [&](const auto &entry) {
            return entry.second == actual && entry.first % kPerProduct == place &&
                   (!isHere(entry.first) || m_unsure.count(entry.first));
        };
        return isVst2() &&
               (m_allMarks.count({-1, actual}) || std::any_of(m_marks.begin(), m_marks.end(), isIts));
    }

    /// A file of some name, or none where there is something, or was since the last whole scan.
    QString pathFor(const QString &name)
    {
        const QString path = plugins() + '/' + QChar('a' + pick(3)) + '/' + name;
        const bool isFree = !m_files.count(path) && !m_left.contains(path) && !isAway(path);
        return isFree && !catalogueText().contains(path.toUtf8()) ? path : QString();
    }
    void change()
    {
        const QStringList kinds{"install", "install", "update", "update", "update",
                                "remove",  "copy",    "move",   "rename", "unplug"};
        const QString path =
            m_files.empty() ? QString() : std::next(m_files.begin(), pick(int(m_files.size())))->first;
        QString kind = kinds[pick(kinds.size())];
        if (path.isEmpty() || isAway(path))
            kind = kinds.first();
        const QString target =
            pathFor(kind == "install" ? (pick(2) ? "A" : "B") + m_info.moduleEnding : fileNameOf(path));
        const bool needsTarget = kind == "install" || kind == "copy" || kind == "move";
        if (needsTarget && target.isEmpty())
            return;
        history << QStringList{" ", kind, path, target}.join(' ');
        if (kind == "install")
            install(target);
        else if (kind == "update")
            update(path);
        else if (kind == "rename")
            renameFolder(plugins() + '/' + QChar('a' + pick(3)), QChar('a' + pick(5)));
        else if (kind == "unplug")
            unplug(QChar('a' + pick(3)));
        else if (kind == "remove" && QFile::remove(path))
            leave(path);
        else if (kind == "move" && QFile::rename(path, target)) {
            move(path, target);
            if (pick(2) == 0) // an installer brings another version
                update(target);
        } else if (kind == "copy" && QFile::copy(path, target))
            (m_files[target] = m_files[path]).kept.clear();
    }
    void install(const QString &target)
    {
        File file;
        file.version = ++m_versions;
        file.product = pick(3) + (target.contains("/A") ? 0 : 3);
        file.offers = numbersOf(file.product);
        for (int number = file.product * kPerProduct; number < (file.product + 1) * kPerProduct; ++number)
            if (!isHere(number))
                m_unsure.insert(number);
        m_files[target] = file;
        m_folder.write(target, "x");
        if (pick(3) == 0)
            update(target);
    }
    void update(const QString &path)
    {
        File &file = m_files[path];
        file.version = ++m_versions;
        file.way = pick(2) == 0 ? Way::Lists : static_cast<Way>(pick(4));
        file.offers = numbersOf(file.product);
        file.deadly = isShell(file.product) && pick(3) == 0 ? *file.offers.begin() : -1;
        history << QString("    way %1, deadly %2, offers").arg(int(file.way)).arg(file.deadly);
        for (const int number : file.offers)
            history.last() += QString(" %1").arg(number);
    }
    void move(const QString &path, const QString &target)
    {
        if (!isGood(path, m_files[path]))
            m_unsure.insert(m_files[path].kept.begin(), m_files[path].kept.end());
        m_files[target] = m_files[path];
        m_files[target].keptVersion = -1;
        leave(path);
    }
    void leave(const QString &path)
    {
        m_files.erase(path);
        m_asleep.erase(path);
        m_left.append(path);
        for (auto culprit = m_culprits.begin(); culprit != m_culprits.end();)
            culprit = culprit->startsWith(path) ? m_culprits.erase(culprit) : std::next(culprit);
    }
    void renameFolder(const QString &folder, const QString &name)
    {
        const QString target = plugins() + '/' + name;
        for (const EffectRecord &record : catalogue())
            if (record.path.startsWith(target + '/'))
                return; // what lay there may come back
        if (QDir(target).exists() || QDir(m_folder.path("away-" + name)).exists() ||
            !QDir().rename(folder, target))
            return;
        const auto files = m_files;
        for (const auto &entry : files)
            if (entry.first.startsWith(folder + '/'))
                move(entry.first, target + entry.first.mid(folder.size()));
    }
    /// Takes a folder away, or puts it back.
    void unplug(const QString &name)
    {
        const QString folder = plugins() + '/' + name, away = m_folder.path("away-" + name);
        for (const auto &[path, file] : m_files)
            if (path.startsWith(folder + '/') && file.keptVersion < 0) // moved there, and never seen
                m_unsure.insert(file.kept.begin(), file.kept.end());
        QDir(folder).exists() ? QDir().rename(folder, away) : QDir().rename(away, folder);
    }
    /// As the workstation does.
    void mark()
    {
        std::vector<EffectRecord> records = catalogue();
        m_allMarks.clear();
        for (EffectRecord &record : records) {
            const int number = numberOf(record);
            if (number < 0 || record.id != idOf(number) || !record.working || !m_marks.count(number) ||
                pick(2)) {
                m_allMarks.insert({number, markOf(record)});
                continue;
            }
            record.category = 1u << number;
            record.favourite = pick(2);
            record.enabled = pick(4) != 0;
            m_marks[number] = markOf(record);
            history << QString("  mark %1").arg(number);
        }
        m_folder.write(folder() + m_info.catalogue->fileName, renderCatalogue(*m_info.catalogue, records));
    }
    /// Notes the files of which the user switched everything off.
    void noteAsleep()
    {
        m_asleep.clear();
        std::set<QString> awake;
        const std::vector<EffectRecord> records = catalogue();
        for (const EffectRecord &record : records)
            if (!record.isSwitchedOff() || record.subId != 0 || record.fileTime.isEmpty())
                awake.insert(record.path);
        for (const EffectRecord &record : records) {
            const auto file = m_files.find(record.path);
            if (awake.count(record.path) == 0 && m_asleep.insert(record.path).second && file != m_files.end())
                file->second.kept.insert(numberOf(record)); // as an interrupted scan listed it
        }
    }

    const PluginFormatInfo &m_info;
    std::mt19937 m_random;
    TestFolder m_folder;
    std::map<QString, File> m_files;
    std::set<QString> m_deadly;   ///< "file-name number stamp" of sub-plug-ins that killed, wherever it lay
    std::set<QString> m_culprits; ///< paths, and "path number stamp" of sub-plug-ins
    std::set<QString> m_asleep;   ///< the user switched off all that the file lists: it is not asked
    QStringList m_left;           ///< paths that were given up since the last whole scan
    Numbers m_unsure;             ///< what cannot be told from its namesakes until the next whole scan
    Numbers m_crashed;            ///< since the last whole scan
    std::map<int, Mark> m_marks;  ///< of what the last whole scan listed
    std::set<std::pair<int, Mark>> m_allMarks; ///< that other records of these bear, or (-1) those of files
    bool m_isSettled = true;
    QString m_part; ///< the only folder that a scan searches; empty: all
    int m_versions = 0;
    Ending m_ending = Ending::Whole;
    int m_countdown = 0;
    AudioPluginHost *m_host = nullptr;      ///< that scans
    std::map<QString, QByteArray> m_frozen; ///< the Effects folder when the process ended
    bool m_hasEnded = false;
    bool m_hasFailed = false; ///< for want of memory
};

struct WorldProbe final : IPluginProbe {
    explicit WorldProbe(World &of)
        : world(of)
    {}
    ProbeOutcome ask(const ProbeJob &job, IProbeObserver &observer) override
    {
        return world.probe(job, observer);
    }
    World &world;
};

template <typename Host>
struct WorldHost final : Host {
    explicit WorldHost(World &of)
        : world(of)
    {
        this->setCatalogueFolder(world.folder());
    }
    QStringList folders() const override { return {world.plugins()}; }
    bool AddEffect(const EffectRecord &record) override
    {
        world.allocate();
        return Host::AddEffect(record);
    }
    QString moduleTime(const QString &path) const override
    {
        world.allocate();
        return world.stampOf(path);
    }
    std::unique_ptr<IPluginProbe> makeProbe() const override { return std::make_unique<WorldProbe>(world); }
    World &world;
};

bool World::runOnce()
{
    m_hasEnded = m_hasFailed = false;
    m_frozen.clear();
    std::unique_ptr<AudioPluginHost> host = std::make_unique<WorldHost<VST3Host>>(*this);
    if (isVst2())
        host = std::make_unique<WorldHost<VSTHost>>(*this);
    if (m_info.format == PluginFormat::Clap)
        host = std::make_unique<WorldHost<CLAPHost>>(*this);
    m_host = host.get();
    if (!m_part.isEmpty()) {
        const auto finder = std::make_shared<FileFinder>(QStringList(m_info.moduleEnding));
        finder->setArea({{m_part}, {}});
        host->setFileFinder(finder);
    }
    host->ReadCatalogue();
    host->Scan(true, true);
    const bool isWhole = !m_hasEnded && !m_hasFailed && !host->isCancelled();
    if (m_hasEnded) {
        for (const QFileInfo &file : QDir(folder()).entryInfoList(QDir::Files))
            QFile::remove(file.filePath());
        for (const auto &[file, content] : m_frozen)
            m_folder.write(file, content);
    } else {
        EXPECT_EQ(m_folder.markers(), QStringList());
    }
    std::set<QString> ids;
    for (const EffectRecord &record : catalogue())
        EXPECT_TRUE(ids.insert(record.id).second) << qPrintable(record.id) << " is there twice";
    return isWhole;
}

/// A format, and a block of seeds: none takes long, also with sanitizers.
class KeepingModel : public testing::TestWithParam<std::tuple<PluginFormat, int>> {};

} // namespace

TEST_P(KeepingModel, LosesNothingAndBlamesNobodyElse)
{
    if (QDir(kMemoryFolder).exists()) // thousands of scans, each of which has its catalogue synced to disk
        qputenv("TMPDIR", kMemoryFolder);
    const int seeds = QDir::tempPath() == QLatin1String(kMemoryFolder) ? kSeedsInMemory : kSeedsOnDisk;
    const auto [format, block] = GetParam();
    const int one = qEnvironmentVariableIntValue("FXPROBE_SEED");
    const int last = one ? one : (block + 1) * seeds;
    for (int seed = one ? one : block * seeds + 1; seed <= last && !HasFailure(); ++seed) {
        const CapturedLog log;
        World world(format, static_cast<unsigned>(seed));
        world.play();
        if (HasFailure())
            ADD_FAILURE() << "FXPROBE_SEED=" << seed << '\n' << qPrintable(world.history.join('\n'));
    }
}

INSTANTIATE_TEST_SUITE_P(Of, KeepingModel,
                         testing::Combine(testing::Values(PluginFormat::Vst2, PluginFormat::Vst3,
                                                          PluginFormat::Clap),
                                          testing::Range(0, kBlocks)),
                         [](const auto &row) {
                             return formatInfo(std::get<0>(row.param)).key +
                                    std::to_string(std::get<1>(row.param));
                         });
