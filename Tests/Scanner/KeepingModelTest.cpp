#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/AudioEngineController/Effects/VST3/VST3Host.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestFolder.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <gtest/gtest.h>

#include <random>
#include <set>

// Random histories of a few files, checked against the rules: a mark leaves only with its plug-in, a culprit
// stays a culprit, no identifier twice, no dead path but below a folder that is away. A plug-in has a number,
// which is also the bit of the only category that a user gives it, so that a mark that strays is seen.

namespace {

constexpr int kProducts = 6; ///< three bear each file name
constexpr int kPerProduct = 4;
constexpr int kSteps = 9;
constexpr int kSeedsInMemory = 100; ///< of each block
constexpr int kSeedsOnDisk = 10;
constexpr int kBlocks = 5; ///< of each format
constexpr char kMemoryFolder[] = "/dev/shm";

enum class Way { Lists, Fails, HalfWritten, Kills };
enum class Ending { Whole, Cancelled, Terminated, Killed };

struct File {
    int product = 0;
    int version = 0;
    Way way = Way::Lists;
    std::set<int> offers; ///< numbers of its plug-ins
    int deadly = -1;      ///< the sub-plug-in that kills the process
    std::set<int> kept;   ///< what the last whole scan listed under its path
    int keptVersion = 0;  ///< as of then
};

struct Mark {
    quint32 category = 0;
    bool favourite = false;
    bool isOff = false;

    bool operator==(const Mark &other) const
    {
        return category == other.category && favourite == other.favourite && isOff == other.isOff;
    }
};

Mark markOf(const EffectRecord &record)
{
    return {record.category, record.favourite, record.isSwitchedOff()};
}

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

    void play();
    QStringList history;

    QString folder() const { return m_folder.effects(); }
    QStringList plugins() const { return {m_folder.plugins()}; }
    QString stampOf(const QString &path) const
    {
        const auto file = m_files.find(path);
        return file == m_files.end() ? QString() : QString("version %1").arg(file->second.version);
    }
    ProbeOutcome probe(const ProbeJob &job, IProbeObserver &observer);
    AudioPluginHost *host = nullptr; ///< that scans

private:
    bool isVst2() const { return m_info.format == PluginFormat::Vst2; }
    bool isShell(int product) const { return isVst2() && product % 3 != 0; }
    int pick(int count) { return static_cast<int>(m_random() % static_cast<unsigned>(count)); }
    QString idOf(int number) const
    {
        return isVst2() ? QString("P:%1").arg(number) : QString("%1").arg(number, 32, 16, QChar('0'));
    }
    std::set<int> numbersOf(int product)
    {
        std::set<int> numbers;
        for (int sub = 1; sub < kPerProduct; ++sub)
            if (pick(3) != 0)
                numbers.insert(product * kPerProduct + sub);
        if (numbers.empty() || (isVst2() && !isShell(product)))
            numbers = {product * kPerProduct + (isVst2() && !isShell(product) ? 0 : 1)};
        return numbers;
    }
    bool isThere(const QString &path) const { return m_files.count(path) != 0 && !isAway(path); }
    static bool isAway(const QString &path) { return !QFileInfo(path).dir().exists(); }
    bool isGood(const QString &path, const File &file) const
    {
        return file.way == Way::Lists && isThere(path) && !m_culprits.count(path) && !m_asleep.count(path);
    }
    bool isChildCulprit(const QString &path, int number) const
    {
        return m_culprits.count(path + QString(" %1 %2").arg(number).arg(stampOf(path))) != 0;
    }
    /// How many files have a plug-in; `bad`: of those that do not list.
    int countOf(int number, bool bad) const
    {
        int count = 0;
        for (const auto &[path, file] : m_files)
            count += isGood(path, file) ? !bad && file.offers.count(number) : int(file.kept.count(number));
        return count;
    }

    QString pathFor(const QString &name)
    {
        const QString path = m_folder.plugins() + '/' + QChar('a' + pick(3)) + '/' + name;
        return m_files.count(path) || m_left.contains(path) || isAway(path) ? QString() : path;
    }
    QString anyFile()
    {
        if (m_files.empty())
            return {};
        const QString path = std::next(m_files.begin(), pick(int(m_files.size())))->first;
        return isAway(path) ? QString() : path;
    }
    void change();
    void install(const QString &target);
    void update(const QString &path);
    void move(const QString &path, const QString &target);
    void renameFolder(const QString &from, const QString &to);
    void unplug(const QString &folder);
    void leave(const QString &path);
    void mark();
    void noteAsleep();

    void reach(const QString &culprit, int number, bool kills);
    void doubtDropped();
    bool scan();
    bool runOnce();
    std::vector<EffectRecord> catalogue() const;
    QString shown() const;
    int numberOf(const EffectRecord &record) const;
    void expectEachOnce(const std::vector<EffectRecord> &records) const;
    void checkAll();
    void checkMarks(const std::map<int, EffectRecord> &found);
    void checkMark(int number, const EffectRecord *record);

    const PluginFormatInfo &m_info;
    std::mt19937 m_random;
    TestFolder m_folder;
    std::map<QString, File> m_files;
    std::set<QString> m_deadly;   ///< "file-name number stamp" of sub-plug-ins that killed, wherever it lay
    std::set<QString> m_culprits; ///< paths, and "path number stamp" of sub-plug-ins
    std::set<QString> m_asleep;   ///< the user switched off what speaks for the file: it is not asked
    QStringList m_left;           ///< paths that were given up since the last whole scan
    std::set<int> m_unsure;       ///< what cannot be told from its namesakes until the next whole scan
    std::set<int> m_crashed;      ///< since the last whole scan
    std::map<int, Mark> m_marks;  ///< of what the last whole scan listed
    bool m_isSettled = true;
    int m_versions = 0;
    Ending m_ending = Ending::Whole;
    int m_countdown = 0;
    std::map<QString, QByteArray> m_frozen; ///< the Effects folder when the process ended
    bool m_hasEnded = false;
};

class WorldProbe : public IPluginProbe {
public:
    explicit WorldProbe(World &world)
        : m_world(world)
    {}
    ProbeOutcome run(const ProbeJob &job, IProbeObserver &observer) override
    {
        return m_world.probe(job, observer);
    }

private:
    World &m_world;
};

template <typename Host>
class WorldHost : public Host {
public:
    explicit WorldHost(World &world)
        : m_world(world)
    {
        this->setCatalogueFolder(world.folder());
    }
    QStringList folders() const override { return m_world.plugins(); }
    QString moduleTime(const QString &path) const override { return m_world.stampOf(path); }
    std::unique_ptr<IPluginProbe> makeProbe() const override { return std::make_unique<WorldProbe>(m_world); }

private:
    World &m_world;
};

ProbeOutcome World::probe(const ProbeJob &job, IProbeObserver &observer)
{
    const File &file = m_files.at(job.path);
    EXPECT_EQ(m_culprits.count(job.path), 0u) << "loads the culprit " << qPrintable(job.path);
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
        record.name = QString("Plug-in %1").arg(number);
        record.id = idOf(number);
        if (isShell(file.product)) {
            record.subId = static_cast<quint32>(number % kPerProduct);
            record.subName = record.name;
            if (job.leftOut.count(record.subId) == 0) {
                EXPECT_FALSE(isChildCulprit(job.path, number));
                observer.childBegins(record);
                reach(job.path + QString(" %1 %2").arg(number).arg(job.fileTime), number,
                      number == file.deadly);
                observer.childEnds(ProbeOutcome());
            } else { // here, or where the file lay before
                const QString child = job.path + QString(" %1 %2").arg(number).arg(job.fileTime);
                EXPECT_TRUE(m_deadly.count(fileNameOf(child))) << qPrintable(child);
                m_culprits.insert(child);
                record.id.clear();
                record.enabled = record.working = false;
            }
        }
        outcome.records.push_back(record);
    }
    return outcome;
}

/// A moment of a probe: the process ends here when the plug-in kills it, or somebody else.
void World::reach(const QString &culprit, int number, bool kills)
{
    const bool isInterrupted = m_ending != Ending::Whole && --m_countdown == 0;
    if (!kills && isInterrupted && m_ending == Ending::Cancelled) {
        host->cancel();
        doubtDropped();
    }
    if (!kills && (!isInterrupted || m_ending == Ending::Cancelled))
        return;
    const bool isBlamed = kills || m_ending == Ending::Killed;
    history.append((isBlamed ? "    killed in " : "    ended in ") + culprit);
    for (const QFileInfo &file : QDir(folder()).entryInfoList(QDir::Files))
        if (isBlamed || file.suffix() == "xml")
            m_frozen[file.filePath()] = m_folder.read(file.filePath());
    if (isBlamed) {
        m_culprits.insert(culprit);
        m_deadly.insert(fileNameOf(culprit));
        m_crashed.insert(number);
    }
    m_hasEnded = true;
    doubtDropped();
    throw ProcessEnded();
}

/// What a file does not offer any more may be forgotten before its copy, or an update, comes to offer it.
void World::doubtDropped()
{
    for (const auto &[path, file] : m_files)
        for (const int number : file.kept)
            if (file.offers.count(number) == 0)
                m_unsure.insert(number);
}

/// One run of the scanner; false when it ended early.
bool World::runOnce()
{
    m_hasEnded = false;
    m_frozen.clear();
    std::unique_ptr<AudioPluginHost> scanning;
    if (isVst2())
        scanning = std::make_unique<WorldHost<VSTHost>>(*this);
    else
        scanning = std::make_unique<WorldHost<VST3Host>>(*this);
    host = scanning.get();
    host->ReadCatalogue();
    host->Scan(true, true);
    const bool isWhole = !m_hasEnded && !host->isCancelled();
    if (m_hasEnded) {
        for (const QFileInfo &file : QDir(folder()).entryInfoList(QDir::Files))
            QFile::remove(file.filePath());
        for (const auto &[file, content] : m_frozen)
            m_folder.write(file, content);
    } else {
        EXPECT_EQ(m_folder.markers(), QStringList());
    }
    expectEachOnce(catalogue());
    return isWhole;
}

/// False when the scan was interrupted and is left so.
bool World::scan()
{
    m_ending = pick(2) == 0 ? Ending::Whole : static_cast<Ending>(pick(4));
    m_countdown = 1 + pick(5);
    history.append(QString("  scan, ending %1 after %2").arg(int(m_ending)).arg(m_countdown));
    for (int run = 0; run < 30; ++run) {
        if (runOnce()) {
            m_ending = Ending::Whole;
            return true;
        }
        const bool wasInterrupted = m_ending != Ending::Whole && m_countdown <= 0;
        if (wasInterrupted)
            m_ending = Ending::Whole;
        if (wasInterrupted && pick(2) == 0)
            return false;
    }
    ADD_FAILURE() << "the scan never settles";
    return false;
}

std::vector<EffectRecord> World::catalogue() const
{
    return readCatalogueFile(*m_info.catalogue, folder() + m_info.catalogue->fileName).records;
}

QString World::shown() const
{
    QString text;
    for (const EffectRecord &record : catalogue())
        text += QString("\n    %1 [%2] %3 \"%4\": category %5, favourite %6, enabled %7, working %8")
                    .arg(record.path, record.fileTime, record.id, record.name)
                    .arg(record.category)
                    .arg(record.favourite)
                    .arg(record.enabled)
                    .arg(record.working);
    return text;
}

void World::expectEachOnce(const std::vector<EffectRecord> &records) const
{
    std::set<QString> ids;
    for (const EffectRecord &record : records)
        EXPECT_TRUE(ids.insert(record.id).second) << qPrintable(record.id) << " is there twice";
}

/// -1 for a record that stands for a file.
int World::numberOf(const EffectRecord &record) const
{
    for (int number = 0; number < kProducts * kPerProduct; ++number)
        if (record.id == idOf(number))
            return number;
    const auto file = m_files.find(record.path);
    if (!isVst2() || file == m_files.end() || (isShell(file->second.product) && record.subId == 0))
        return -1;
    return file->second.product * kPerProduct + int(record.subId);
}

void World::checkAll()
{
    std::map<int, EffectRecord> found;
    for (const EffectRecord &record : catalogue()) {
        SCOPED_TRACE(qPrintable(record.path + " " + record.id));
        EXPECT_TRUE(isThere(record.path) || isAway(record.path)) << "a dead path";
        const bool isUsable = record.enabled && record.working;
        EXPECT_FALSE(isUsable && m_culprits.count(record.path)) << "a culprit is offered";
        const int number = numberOf(record);
        if (number < 0) {
            const bool isCrashed = m_culprits.count(record.path) != 0; // nobody knows what it would list
            EXPECT_TRUE(isCrashed || isAway(record.path) || markOf(record) == Mark()) << "a file has marks";
            continue;
        }
        const auto file = m_files.find(record.path);
        const bool wasHere = file != m_files.end() && file->second.kept.count(number);
        if (record.id == idOf(number) || found.count(number) == 0 ||
            (wasHere && found[number].id != idOf(number)))
            found[number] = record;
        const bool isStale = file != m_files.end() && isGood(record.path, file->second) &&
                             file->second.offers.count(number) == 0;
        EXPECT_FALSE(isStale) << "is not there any more";
    }
    for (const auto &[path, file] : m_files)
        for (const int number : isGood(path, file) ? file.offers : std::set<int>()) {
            SCOPED_TRACE(qPrintable(path + QString(" offers %1").arg(number)));
            bool isHeldByBad = false;
            for (const auto &[other, held] : m_files)
                isHeldByBad |= isThere(other) && !isGood(other, held) && held.kept.count(number);
            if (isHeldByBad)
                continue;
            const bool isAsked = file.kept.empty() || file.version != file.keptVersion;
            if (!isAsked && !file.kept.count(number)) {
                m_unsure.insert(number); // another file listed it, and this one is not asked
                continue;
            }
            ASSERT_TRUE(found.count(number)) << "is lost";
            if (isChildCulprit(path, number))
                continue;
            const EffectRecord &record = found[number];
            EXPECT_TRUE(isThere(record.path) && isGood(record.path, m_files[record.path]))
                << qPrintable(record.path);
            EXPECT_EQ(record.working, !isChildCulprit(record.path, number));
        }
    checkMarks(found);
    for (auto &[path, file] : m_files) {
        file.keptVersion = file.version;
        file.kept.clear();
        for (const auto &[number, record] : found)
            if (record.path == path)
                file.kept.insert(number);
    }
}

void World::checkMarks(const std::map<int, EffectRecord> &found)
{
    std::map<int, Mark> marks;
    for (int number = 0; number < kProducts * kPerProduct; ++number) {
        SCOPED_TRACE(number);
        const auto entry = found.find(number);
        checkMark(number, entry == found.end() ? nullptr : &entry->second);
        if (entry != found.end())
            marks[number] = markOf(entry->second);
    }
    m_marks = marks;
}

void World::checkMark(int number, const EffectRecord *record)
{
    const bool wasThere = m_marks.count(number) != 0;
    const bool isBad = countOf(number, true) || m_crashed.count(number) ||
                       std::any_of(m_files.begin(), m_files.end(),
                                   [&](const auto &entry) { return isChildCulprit(entry.first, number); });
    const auto isCopy = [&](const auto &entry) { return entry.second.product == number / kPerProduct; };
    const bool hasCopies = std::count_if(m_files.begin(), m_files.end(), isCopy) > 1;
    const bool isUnsure = m_unsure.count(number) || (isBad && hasCopies);
    const Mark wanted = wasThere ? m_marks.at(number) : Mark();
    Mark actual = record ? markOf(*record) : Mark();
    const bool hasCrashed = m_crashed.count(number) || (record && m_culprits.count(record->path));
    if (hasCrashed && actual.category == wanted.category) // the crash takes the place of that
        actual.isOff = wanted.isOff;
    if (wasThere && !isUnsure && countOf(number, false)) {
        EXPECT_TRUE(record) << "is lost with its marks";
        EXPECT_TRUE(actual == wanted) << actual.category << " for " << wanted.category << ", off "
                                      << actual.isOff << " for " << wanted.isOff;
        return;
    }
    bool isAllowed = actual == Mark() || actual.category == wanted.category;
    for (const auto &[other, mark] : m_marks) // nothing but its place tells what replaced a VST 2 plug-in
        isAllowed |= isVst2() && actual == mark && other % kPerProduct == number % kPerProduct &&
                     (countOf(other, false) == 0 || m_unsure.count(other));
    // One that killed keeps its own while a copy is listed, and shows them again when the copy goes.
    isAllowed |= record && isChildCulprit(record->path, number);
    EXPECT_TRUE(isAllowed) << "bears the mark " << actual.category << " of another";
}

void World::install(const QString &target)
{
    if (target.isEmpty())
        return;
    File file;
    file.version = ++m_versions;
    file.product = pick(3) + (target.contains("/A") ? 0 : 3);
    file.offers = numbersOf(file.product);
    for (int number = file.product * kPerProduct; number < (file.product + 1) * kPerProduct; ++number)
        if (countOf(number, false) == 0)
            m_unsure.insert(number);
    m_files[target] = file;
    m_folder.write(target, "x");
    if (pick(3) == 0)
        update(target);
}

void World::update(const QString &path)
{
    File &file = m_files[path];
    file.version = ++m_versions;
    file.way = pick(2) == 0 ? Way::Lists : static_cast<Way>(pick(4));
    file.offers = numbersOf(file.product);
    file.deadly = isShell(file.product) && pick(3) == 0 ? *file.offers.begin() : -1;
    history.append(
        QString("  update %1: way %2, deadly %3, offers").arg(path).arg(int(file.way)).arg(file.deadly));
    for (const int number : file.offers)
        history.last() += QString(" %1").arg(number);
}

void World::move(const QString &path, const QString &target)
{
    if (!isGood(path, m_files[path]))
        m_unsure.insert(m_files[path].kept.begin(), m_files[path].kept.end());
    m_files[target] = m_files[path];
    m_files[target].keptVersion = -1;
    leave(path);
}

void World::leave(const QString &path)
{
    m_files.erase(path);
    m_asleep.erase(path);
    m_left.append(path);
    for (auto culprit = m_culprits.begin(); culprit != m_culprits.end();)
        culprit = culprit->startsWith(path) ? m_culprits.erase(culprit) : std::next(culprit);
}

void World::renameFolder(const QString &from, const QString &to)
{
    const QString folder = m_folder.plugins() + '/' + from, target = m_folder.plugins() + '/' + to;
    for (const EffectRecord &record : catalogue())
        if (record.path.startsWith(target + '/'))
            return; // what lay there may come back
    if (QDir(target).exists() || QDir(m_folder.path("away-" + to)).exists() || !QDir().rename(folder, target))
        return;
    history.append("  rename " + from + " to " + to);
    const auto files = m_files;
    for (const auto &entry : files)
        if (entry.first.startsWith(folder + '/'))
            move(entry.first, target + entry.first.mid(folder.size()));
}

void World::unplug(const QString &name)
{
    const QString folder = m_folder.plugins() + '/' + name, away = m_folder.path("away-" + name);
    history.append("  unplug or plug in " + name);
    for (const auto &[path, file] : m_files)
        if (path.startsWith(folder + '/') && file.keptVersion < 0) // moved there, and never seen
            m_unsure.insert(file.kept.begin(), file.kept.end());
    QDir(folder).exists() ? QDir().rename(folder, away) : QDir().rename(away, folder);
}

/// As the workstation does.
void World::mark()
{
    std::vector<EffectRecord> records = catalogue();
    for (EffectRecord &record : records) {
        const int number = numberOf(record);
        if (number < 0 || record.id != idOf(number) || !record.working || m_marks.count(number) == 0 ||
            pick(2))
            continue;
        record.category = 1u << number;
        record.favourite = pick(2);
        record.enabled = pick(4) != 0;
        m_marks[number] = markOf(record);
        history.append(QString("  mark %1").arg(number));
    }
    m_folder.write(folder() + m_info.catalogue->fileName, renderCatalogue(*m_info.catalogue, records));
}

/// Files for which a plug-in speaks that the user switched off.
void World::noteAsleep()
{
    m_asleep.clear();
    std::set<QString> spokenFor;
    for (const EffectRecord &record : catalogue())
        if (record.standsForFile())
            spokenFor.insert(record.path);
    for (const EffectRecord &record : catalogue())
        if (spokenFor.insert(record.path).second && record.isSwitchedOff() && record.subId == 0)
            m_asleep.insert(record.path);
}

void World::change()
{
    const QString path = anyFile();
    const int what = pick(10);
    if (path.isEmpty() || what < 2) {
        const QString target = pathFor(QString(pick(2) ? "A" : "B") + m_info.moduleEnding);
        history.append("  install " + target);
        return install(target);
    }
    const QString target = pathFor(fileNameOf(path));
    if (what < 5) {
        update(path);
    } else if (what == 5) {
        history.append("  remove " + path);
        QFile::remove(path);
        leave(path);
    } else if (what == 6 && !target.isEmpty()) {
        history.append("  copy " + path + " to " + target);
        m_folder.write(target, "x");
        m_files[target] = m_files[path];
        m_files[target].kept.clear();
    } else if (what == 7 && !target.isEmpty()) {
        history.append("  move " + path + " to " + target);
        QFile::rename(path, target);
        move(path, target);
    } else if (what == 8) {
        renameFolder(QChar('a' + pick(3)), QChar('a' + pick(5)));
    } else if (what == 9) {
        unplug(QChar('a' + pick(3)));
    }
}

void World::play()
{
    for (int step = 0; step < kSteps && !testing::Test::HasFailure(); ++step) {
        history.append(QString("step %1").arg(step));
        noteAsleep();
        if (!m_isSettled)
            doubtDropped();
        for (int count = 1 + pick(3); count > 0; --count)
            change();
        m_isSettled = scan();
        history.append(shown());
        if (!m_isSettled || testing::Test::HasFailure())
            continue;
        checkAll();
        m_unsure.clear();
        m_crashed.clear();
        m_left.clear();
        const QByteArray before = m_folder.catalogue(m_info.catalogue->fileName);
        EXPECT_TRUE(runOnce());
        const bool isSame = m_folder.catalogue(m_info.catalogue->fileName) == before;
        EXPECT_TRUE(isSame) << "scanned again: " << qPrintable(shown());
        mark();
    }
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
                         testing::Combine(testing::Values(PluginFormat::Vst2, PluginFormat::Vst3),
                                          testing::Range(0, kBlocks)),
                         [](const auto &row) {
                             return formatInfo(std::get<0>(row.param)).key +
                                    std::to_string(std::get<1>(row.param));
                         });
