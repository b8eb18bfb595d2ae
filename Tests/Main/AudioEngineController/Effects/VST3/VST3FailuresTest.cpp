#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QDir>
#include <QFile>

namespace {

QByteArray moduleBytes()
{
    QFile module(vst3FixturePath());
    EXPECT_TRUE(module.open(QIODevice::ReadOnly));
    return module.readAll();
}

/// The module, made for another kind of machine.
QByteArray foreignModule()
{
    const int machine = 18; // e_machine, elf(5)
    QByteArray bytes = moduleBytes();
    bytes[machine] = '\xB7';
    return bytes;
}

/// The module, needing something by a name that nothing has.
QByteArray moduleNeeding(const QByteArray &name, const QByteArray &wrongName)
{
    QByteArray bytes = moduleBytes();
    EXPECT_TRUE(bytes.contains(name));
    return bytes.replace(name, wrongName);
}

class VST3Failures : public VST3ScanBench {
protected:
    /// A bundle whose binaries all bear other names than its own.
    void addBundle(const QString &name, const QStringList &binaries) const
    {
        const QString folder = modulePath(name) + QStringLiteral("/Contents/x86_64-linux");
        EXPECT_TRUE(QDir().mkpath(folder));
        for (const QString &binary : binaries)
            EXPECT_TRUE(QFile::copy(vst3FixturePath(), folder + QLatin1Char('/') + binary));
    }
};

} // namespace

TEST_F(VST3Failures, FilesThatFailAreRecordedOnceWithTheirReasonInTheLog)
{
    const struct {
        const char *name;
        QByteArray content; // of the file; else of its script
        QByteArray script;
        const char *reason;
    } cases[] = {
        {"a empty file", "", {}, "file too short"},
        {"b text file", QByteArray("this is no plug-in\n").repeated(100), {}, "invalid ELF header"},
        {"c other machine", foreignModule(), {}, "c other machine.vst3: "},
        {"d missing library", moduleNeeding("libstdc++.so", "libstdc--.so"), {}, "libstdc--.so"},
        {"e missing symbol", moduleNeeding("dladdr", "dlaxxr"), {}, "undefined symbol: dlaxxr"},
        {"f entry refuses", {}, "class A\nanswer module-entry false\n", "reports that it could not start"},
        {"g no class", {}, "", "No audio class could be listed, of 0 classes"},
        {"h empty bundle", {}, {}, "the bundle has no module in Contents/x86_64-linux"},
        {"i ambiguous bundle", {}, {}, "the bundle has several modules and none of its own name"},
        {"j all classes fail", {}, "class A\nclass B\nanswer initialize false\n", "could not be initialised"},
        {"k no audio class", {}, "class A\ncategory Other\n", "No audio class could be listed, of 1 classes"},
    };
    QStringList expected;
    for (const auto &row : cases) {
        const QString name = QString::fromLatin1(row.name);
        if (!row.content.isNull())
            addRaw(name, row.content);
        else if (!row.script.isNull())
            add(name, row.script);
        expected.append(name + QLatin1Char('|') + name + QStringLiteral("|1|0|0|-1|-1"));
    }
    addBundle(QStringLiteral("h empty bundle"), {});
    addBundle(QStringLiteral("i ambiguous bundle"), texts({"one.so", "two.so"}));
    add(QStringLiteral("z healthy"));
    expected.append(QStringLiteral("z healthy"));
    const ScannerOutcome outcome = scan();
    for (const auto &row : cases)
        EXPECT_TRUE(outcome.log.contains(QLatin1String(row.reason))) << row.name << ":\n"
                                                                     << qPrintable(outcome.log);
    QStringList found = sortedRecords("Name ID Enabled Working Favourite Inputs Outputs");
    found.last() = found.last().section(QLatin1Char('|'), 0, 0);
    EXPECT_EQ(found, expected);
    const QByteArray catalogue = m_folder.catalogue();
    EXPECT_FALSE(scan().log.contains(QStringLiteral("Cannot load")));
    EXPECT_EQ(loaded(), QStringList());
    EXPECT_EQ(m_folder.catalogue(), catalogue);
}

TEST_F(VST3Failures, ModulesWithoutAFactoryAreNotRecordedAndTriedEachTime)
{
    add(QStringLiteral("Null factory"), "answer get-factory null\n");
    add(QStringLiteral("No interface"), "generation 0\n");
    add(QStringLiteral("No export"), {}, VST3Fixture::NoEntry);
    add(QStringLiteral("Healthy"));
    for (int run = 0; run < 2; ++run) {
        const ScannerOutcome outcome = scan();
        EXPECT_EQ(records("Name"), texts({"Healthy"}));
        EXPECT_EQ(outcome.log.count(QStringLiteral("VST3 Exception: Failed to get factory function")), 3);
        EXPECT_EQ(loaded(), run == 0 ? texts({"Healthy", "No interface", "Null factory"})
                                     : texts({"No interface", "Null factory"}));
    }
}

TEST_F(VST3Failures, FailingFilesOfOneNameInTwoFolders)
{
    addRaw(QStringLiteral("a/Same"), "no module");
    const QByteArray second = addRaw(QStringLiteral("b/Same"), "no module").toUtf8();
    scan();
    const QStringList expected = texts({("Same|" + second + "|0").constData(), "Same|Same|0"});
    EXPECT_EQ(records("Name ID Working"), expected);
    EXPECT_FALSE(scan().log.contains(QStringLiteral("Cannot load")));
    EXPECT_EQ(records("Name ID Working"), expected);
}

TEST_F(VST3Failures, WaveShellsWithoutClassesAreTriedAgain)
{
    add(QStringLiteral("WaveShell1-VST3 9.2"), "");
    addRaw(QStringLiteral("WaveShell2-VST3 9.2"), "no module");
    add(QStringLiteral("Full WaveShell"));
    for (int run = 0; run < 2; ++run) {
        EXPECT_TRUE(scan().log.contains(QStringLiteral("Cannot load the module ") +
                                        modulePath(QStringLiteral("WaveShell2-VST3 9.2"))));
        EXPECT_EQ(records("Name Working"), texts({"Full WaveShell|1"}));
        EXPECT_TRUE(loaded().contains(QStringLiteral("WaveShell1-VST3 9.2")));
        EXPECT_EQ(loaded().contains(QStringLiteral("Full WaveShell")), run == 0);
    }
}

// Each stage in a module of its own, all in one run. What was listed before the exception stays.
TEST_F(VST3Failures, ExceptionsEndTheListingAndNothingElse)
{
    const struct {
        const char *stage;
        const char *ofClass;
        const char *listed; // "": the file is not recorded; "-": it is, as not working
    } cases[] = {
        {"module-entry", "", "-"},        {"get-factory", "", ""},        {"factory-info", "", "-"},
        {"count-classes", "", "-"},       {"class-info", "B", "A"},       {"class-info2", "B", "A"},
        {"class-info-unicode", "B", "A"}, {"create-instance", "B", "A"},  {"initialize", "B", "A"},
        {"bus-count", "B", "A"},          {"bus-info", "B", "A"},         {"terminate", "B", "AB"},
        {"release", "B", "AB"},           {"factory-release", "", "ABC"}, {"module-exit", "", "ABC"}};
    QStringList expected{QStringLiteral("z healthy|1")};
    for (const QByteArray kind : {"throw-std", "throw-int"}) {
        for (const auto &row : cases) {
            const QByteArray name = row.stage + (' ' + kind);
            QByteArray script = QByteArray("fault ") + row.stage + ' ' + kind;
            if (*row.ofClass)
                script += " \"" + name + ' ' + row.ofClass + '"';
            for (const char *letter : {"A", "B", "C"})
                script += "\nclass \"" + name + ' ' + letter + '"';
            add(QString::fromLatin1(name), script + '\n');
            for (const char letter : QByteArray(row.listed))
                expected.append(
                    QString::fromLatin1(letter == '-' ? name + "|0" : name + ' ' + letter + "|1"));
        }
    }
    add(QStringLiteral("z healthy"));
    const ScannerOutcome outcome = scan();
    expected.sort();
    EXPECT_EQ(sortedRecords("Name Working"), expected);
    EXPECT_EQ(outcome.log.count(QStringLiteral("thrown by the fixture")), static_cast<int>(std::size(cases)));
    EXPECT_EQ(loaded().size(), 2 * static_cast<int>(std::size(cases)) + 1);
    EXPECT_EQ(trace().filter(QStringLiteral(" static-destructor")).size(), loaded().size());
}
