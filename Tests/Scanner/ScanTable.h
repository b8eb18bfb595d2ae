#pragma once

#include "Main/AudioEngineController/Effects/Protocol/FolderRules.h"
#include "Tests/Support/PlatformValues.h"
#include "Tests/Support/ScanBench.h"
#include "Tests/Support/VST2Fixture.h"
#include "Workstation/Manage/AskAgain.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QRegularExpression>

#include <functional>

// Whole scans, each a few steps. Files of "put" lie in "Plugins", others in the data folder, which "@" stands
// for; "~" is what separates paths, "\n" a line's end, and "." in a list an empty one.
//   put, new FILE, …: STATEMENT | … scripted modules, dated as of the first scan or as updated; "#1" is an id
//   write FILE: TEXT; remove FILE; move FILE FILE (or folder); holds FILE: TEXT
//   link FILE FILE                where it lies and where it leads; where there are links
//   short FILE BYTES              ends a file after so many and dates it as updated; date FILE TIME
//   blank FILE BYTES              the same with zeros behind, so that its size stays
//   folders FOLDER…               what the scan list names; only PATH… what scans from now on search of it
//   excluded PATH…, ignored PATH… what the folder rules name
//   mark NAME ELEMENT VALUE, …    as the user does
//   edit FILE: OLD => NEW         in a catalogue; cut FILE: TEXT ends it before the text
//   scan [N]                      until no marker survives, which takes N runs (1)
//   during MODULE: STEP           a scan, and a step while the module is initialised; kill ends it by force
//   run                           one run, however it ends; exit N and markers NAME… say how it ended
//   retry NAME                    has it asked again
//   same                          a scan that loads nothing and writes nothing
//   loaded MODULE…                what the scan loaded, in order; closed MODULE: CALL, CALL
//   log: TEXT                     what its log holds; readable FILE, for everybody
//   vst3, vst2, clap ELEMENTS: ROW, ROW what the catalogue lists, in any order
struct ScanCase {
    std::string name;
    QStringList steps;

    friend void PrintTo(const ScanCase &scan, std::ostream *out) { *out << scan.name; }
};

inline std::vector<ScanCase> scanCases(const char *table)
{
    std::vector<ScanCase> cases;
    for (const QString &line : QString::fromUtf8(table).split('\n', Qt::SkipEmptyParts)) {
        if (line.startsWith("= "))
            cases.push_back({line.mid(2).toStdString(), {}});
        else
            cases.back().steps.append(line);
    }
    return cases;
}

inline std::string nameOfScan(const testing::TestParamInfo<ScanCase> &row)
{
    std::string name;
    for (const char character : row.param.name)
        if (std::isalnum(static_cast<unsigned char>(character)))
            name += character;
    return name;
}

class ScanTable : public ScanBench, public testing::WithParamInterface<ScanCase> {
protected:
    ~ScanTable() override { limit({}); }

    void carryOutAll()
    {
        for (const QString &step : GetParam().steps) {
            SCOPED_TRACE(step.toStdString());
            carryOut(step);
            if (IsSkipped())
                return;
        }
    }

    virtual void carryOut(const QString &step)
    {
        const QString head = step.section(':', 0, 0);
        const QString text = resolved(step.section(':', 1)).trimmed();
        const QString verb = head.section(' ', 0, 0);
        const QString file = head.section(' ', 1);
        const auto each = [&](const std::function<void(const QString &)> &act) {
            for (const QString &one : file.split(", "))
                act(one);
        };
        const std::map<QString, std::function<void()>> verbs = {
            {"put", [&] { each([&](const QString &one) { put(one, script(text)); }); }},
            {"new", [&] { each([&](const QString &one) { dateLater(put(one, script(text))); }); }},
            {"write",
             [&] { m_folder.write(file, text.toUtf8().replace("\\n", kLineEnd).replace("\\t", "\t")); }},
            {"holds", [&] { EXPECT_EQ(m_folder.read(file), text.toUtf8()); }},
            {"remove", [&] { EXPECT_TRUE(QFile::remove(m_folder.path(spelt(file)))); }},
            {"link", [&] { link(spelt(file).section(' ', 0, 0), spelt(file).section(' ', 1)); }},
            {"short", [&] { cutShort(file.section(' ', 0, 0), file.section(' ', 1).toLongLong()); }},
            {"blank", [&] { blank(file.section(' ', 0, 0), file.section(' ', 1).toLongLong()); }},
            {"move", [&] { move(spelt(file).split(' ')); }},
            {"date", [&] { date(file.section(' ', 0, -2), file.section(' ', -1) + ':' + text); }},
            {"during", [&] { during(file, step.section(": ", 1)); }},
            {"readable", [&] { EXPECT_TRUE(QFile::permissions(m_folder.path(file)) & QFile::ReadOther); }},
            {"closed",
             [&] { EXPECT_EQ(traceOf(file).filter(QRegularExpression("^close|destr")).join(", "), text); }},
            {"retry",
             [&] { EXPECT_EQ(askAgain(m_folder.effects(), {{file}}, {}, {}).wrong, QStringList()); }},
            {"exit", [&] { EXPECT_EQ(m_last.exitCode, file.toInt()); }},
            {"folders", [&] { m_folder.writeScanList(resolved(file).split(' ')); }},
            {"only", [&] { limit(resolved(spelt(file)).split(' ', Qt::SkipEmptyParts)); }},
            {"excluded", [&] { writeRules(resolved(file).split(' ', Qt::SkipEmptyParts), {}); }},
            {"ignored", [&] { writeRules({}, resolved(spelt(file)).split(' ', Qt::SkipEmptyParts)); }},
            {"mark", [&] { each([this](const QString &one) { markAsUser(one); }); }},
            {"edit",
             [&] { edit(file, text.section(" => ", 0, 0), text.section(" => ", 1).replace("\\t", "\t")); }},
            {"cut",
             [&] { edit(file, m_folder.read(file).mid(m_folder.read(file).indexOf(text.toUtf8())), {}); }},
            {"scan", [&] { scanWithRuns(file.isEmpty() ? 1 : file.toInt()); }},
            {"run", [&] { m_last = scanOnce(); }},
            {"same", [&] { expectNothingToDo(); }},
            {"loaded", [&] { EXPECT_EQ(loaded().join(' '), file == "." ? "" : file); }},
            {"markers", [&] { EXPECT_EQ(m_folder.markers().join(' '), file); }},
            {"log", [&] { EXPECT_TRUE(m_last.log.contains(ofSystem(text))) << qPrintable(m_last.log); }},
            {"vst3", [&] { expectRecords("VST3Configuration.xml", file, text); }},
            {"clap", [&] { expectRecords("CLAPConfiguration.xml", file, text); }},
            {"vst2", [&] { expectRecords("FXConfiguration.xml", file, text); }}};
        verbs.at(verb)();
    }

    /// A text of the table with its stand-ins replaced.
    QString resolved(QString text) const
    {
        return text.replace('@', m_folder.dataFolder())
            .replace('~', QDir::listSeparator())
            .replace(QRegularExpression("\\.vst2\\b"), vst2Ending());
    }

private:
    /// Of "on Linux / on Windows" what holds here.
    static QString ofSystem(const QString &text)
    {
        const QStringList ofSystems = text.split(" / ");
        return ofSystems.value(kSystemsPlace, ofSystems.first());
    }
    static QString spelt(QString file)
    {
        const QString path = QString(kBundlePath).replace("%1", "\\1");
        file.replace('~', QDir::listSeparator()).replace(".vst2", vst2Ending());
        return file.replace(QRegularExpression("(\\w+)\\.bundle"), path);
    }
    static QByteArray script(QString statements)
    {
        statements.replace('%', kForeignLocale)
            .replace(QRegularExpression("#(\\d)"), "id " + QString(31, '0') + "\\1");
        return QString(statements + '\n').replace(" | ", "\n").toUtf8();
    }
    void limit(const QStringList &paths)
    {
        const QByteArray value = paths.join(QDir::listSeparator()).toLocal8Bit();
        value.isEmpty() ? qunsetenv("FXPROBE_ONLY") : qputenv("FXPROBE_ONLY", value);
    }
    void writeRules(const QStringList &excluded, const QStringList &ignored) const
    {
        EXPECT_TRUE(writeFolderRules(m_folder.effects(), {excluded, ignored, {}}));
    }
    void move(const QStringList &paths) const
    {
        QDir().mkpath(QFileInfo(m_folder.path(paths[1])).path());
        QDir().rmdir(m_folder.path(paths[1])); // an empty folder
        EXPECT_TRUE(QFile::rename(m_folder.path(paths[0]), m_folder.path(paths[1])));
        QFile::rename(m_folder.path(paths[0]) + ".script", m_folder.path(paths[1]) + ".script");
    }
    void during(const QString &module, const QString &step)
    {
        forgetTrace();
        ScannerRun scanner(scannerProgram(), m_folder);
        EXPECT_TRUE(scanner.start() && waitForStage(scanner, module, "initialize"));
        step == "kill" ? scanner.kill() : carryOut(step);
        m_last = scanner.wait();
    }
    void date(const QString &file, const QString &time) const
    {
        m_folder.setModified(spelt(file), QDateTime::fromString(time, Qt::ISODate));
    }
    void link(const QString &place, const QString &target)
    {
        if (!QFile::link(m_folder.path(target), m_folder.path(place)) ||
            !QFileInfo(m_folder.path(place)).isSymbolicLink())
            GTEST_SKIP() << "no links can be made here";
    }
    void cutShort(const QString &file, qint64 size) const
    {
        const QString path = m_folder.path(spelt(file));
        EXPECT_TRUE(QFile::resize(path, size));
        dateLater(path);
    }
    /// As a copy leaves it for which space was made, and that broke off.
    void blank(const QString &file, qint64 from) const
    {
        const qint64 size = QFileInfo(m_folder.path(spelt(file))).size();
        cutShort(file, from);
        cutShort(file, size); // longer again, with zeros
    }
    void markAsUser(const QString &words) const
    {
        mark(words.section(' ', 0, -3), words.section(' ', -2, -2).toUtf8(), words.section(' ', -1).toUtf8());
    }
    void edit(const QString &file, const QString &from, const QString &to) const
    {
        const QString text = QString::fromUtf8(m_folder.read(file));
        EXPECT_TRUE(text.contains(from)) << qPrintable(text);
        m_folder.write(file, QString(text).replace(from, to).toUtf8());
    }
    void scanWithRuns(int count)
    {
        if (count > 1) {
            forgetTrace();
            EXPECT_EQ(scanUntilSettled(), hasWorkers() ? 1 : count);
        } else {
            m_last = scan();
        }
    }
    void expectNothingToDo() const
    {
        for (const QString &file : QDir(m_folder.effects()).entryList({"*Configuration.xml"}, QDir::Files))
            dateFirst("Effects/" + file);
        const auto before = effectsFolder();
        const QDateTime modified = QFileInfo(cataloguePath()).lastModified();
        scan();
        EXPECT_EQ(loaded(), QStringList());
        EXPECT_EQ(effectsFolder(), before);
        EXPECT_EQ(QFileInfo(cataloguePath()).lastModified(), modified);
    }
    void expectRecords(const char *file, const QString &elements, const QString &rows) const
    {
        QStringList found = recordsOf(file, elements.toUtf8());
        QStringList expected = ofSystem(spelt(rows)).split(", ");
        found.replaceInStrings(m_folder.plugins() + '/', "");
        found.sort();
        expected.sort();
        EXPECT_EQ(found, rows == "." ? QStringList() : expected);
    }

    ScannerOutcome m_last;
};
