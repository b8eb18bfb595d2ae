#include "Tests/Main/AudioEngineController/Effects/VST/VSTInstanceBench.h"

#include "Core/BaseLib/DebugLog.h"
#include "Main/VLib/SimpleGUI.h"
#include "Tests/Support/NotingUI.h"

#include <QtEndian>

#include <cstring>
#include <limits>

namespace {

class VSTPreset : public VSTInstanceBench {
protected:
    VSTPreset() { debugLogSettings().trace = true; }
};

/// The bytes of a list of one-letter parameters and their values, made by hand.
QByteArray list(const QByteArray &names, const std::vector<float> &values)
{
    QByteArray bytes("\x02\0\0\0", 4);
    bytes.append(char(names.size())).append("\0\0\0", 3);
    for (int index = 0; index < names.size(); ++index) {
        quint32 bits = 0;
        std::memcpy(&bits, &values[static_cast<std::size_t>(index)], sizeof bits);
        bits = qToLittleEndian(bits);
        bytes += names.mid(index, 1) + QByteArray(63, '\0');
        bytes.append(reinterpret_cast<const char *>(&bits), sizeof bits);
    }
    return bytes;
}

QByteArray changed(QByteArray bytes, int at, char byte)
{
    bytes[at] = byte;
    return bytes;
}

} // namespace

TEST_F(VSTPreset, StoresStateOrParametersByteForByte)
{
    const QByteArray longName(63, 'n');
    const struct {
        const char *name;
        QByteArray script;
        bool stored;
        int isChunk;
        QByteArray data;
        const char *trace; // its last line
    } cases[] = {
        {"chunk", "chunk \"ab\\x00c\"", true, 1, QByteArray("ab\0c", 4), "EFFECT SUPPORTS CHUNKS"},
        {"no chunk", "flags 0x30\nparameter A", false, 0, {}, "FAILED"},
        {"one byte is none", "chunk a", false, 0, {}, "FAILED"},
        {"negative size", "chunk abc\nanswer get-chunk -5", false, 0, {}, "FAILED"},
        {"huge size", "chunk abc\nanswer get-chunk 2147483647", false, 0, {}, "FAILED"},
        {"null pointer", "chunk abc\nnull-chunk", false, 0, {}, "FAILED"},
        {"exception", "chunk abc\nfault get-chunk throw-int", false, 0, {}, "FAILED"},
        {"fault", "chunk abc\nfault get-chunk segv", false, 0, {}, "FAILED"},
        {"no parameters", "", true, 0, list({}, {}), "Storing 0 Parameters"},
        {"parameters", "parameter A -1.5\nparameter B nan", true, 0,
         list("AB", {-1.5f, std::numeric_limits<float>::quiet_NaN()}), "Storing 2 Parameters"},
        {"long name", "parameter " + longName + "x 1", true, 0, list("A", {1.0f}).replace(8, 63, longName),
         "Storing 1 Parameters"},
        {"negative count", "stated-parameters -1", false, 0, {}, "EFFECT DOES NOT SUPPORTS CHUNKS"},
        {"huge count", "stated-parameters 2147483647", false, 0, {}, "EFFECT DOES NOT SUPPORTS CHUNKS"},
        {"fault in a parameter",
         "parameter A\nparameter B\nfault get-parameter segv",
         false,
         0,
         {},
         "Storing 2 Parameters"}};
    for (const auto &row : cases) {
        SCOPED_TRACE(row.name);
        const CapturedLog log;
        debugLogSettings().trace = true;
        auto plugin = loaded(row.script + "\nname Comp\nid 7", row.name);
        PluginPreset preset;
        preset.data = "kept";
        EXPECT_EQ(plugin->StorePreset(preset), row.stored);
        EXPECT_EQ(log.lines().filter(QStringLiteral("StorePreset")).last().section('-', 1).trimmed(),
                  QString::fromUtf8(row.trace));
        const bool isKept = !row.stored && qstrcmp(row.name, "one byte is none") != 0;
        EXPECT_EQ(preset.data, isKept ? QByteArray("kept") : row.data);
        EXPECT_EQ(preset.isChunk, row.isChunk);
        if (row.stored) {
            EXPECT_EQ(preset.identifier, QStringLiteral("vst2:Comp:7"));
            EXPECT_EQ(preset.name, "Comp");
            EXPECT_TRUE(plugin->LoadPreset(preset)) << "and it is taken back";
        }
    }
}

TEST_F(VSTPreset, CarriesTheSettingsOfTheObject)
{
    auto plugin = loaded("inputs 1\noutputs 6\nanswer opcode-51 1\nname Comp");
    auto other = loaded("inputs 1\noutputs 6\nanswer opcode-51 1\nname Comp", "Other");
    ASSERT_TRUE(plugin->open(kSettings) && other->open(kSettings));
    plugin->setBypass(true);
    plugin->setRealtime(true);
    plugin->setOwnLatency(-300);
    PluginPreset preset;
    EXPECT_TRUE(plugin->StorePreset(preset));
    EXPECT_EQ(preset.flags, 300u << 16 | 7u);
    EXPECT_EQ(preset.firstChannels, (std::array<qint32, 2>{0, 0}));
    EXPECT_EQ(preset.channelSpans, (std::array<qint32, 2>{1, 6}));
    takeTrace();
    EXPECT_TRUE(other->LoadPreset(preset));
    EXPECT_TRUE(takeTrace().endsWith(QStringLiteral("opcode-44: 0 1")));
    EXPECT_TRUE(other->isBypassed() && other->isRealtime() && other->ownLatency() == 300);
}

TEST_F(VSTPreset, ParametersAreRestoredByName)
{
    auto plugin = loaded("parameter B 9\nparameter A 9\nparameter \" \" 9\nparameter A 9\nparameter C 9\n"
                         "ask-host set-parameter 0 index 1 opt 1");
    PluginPreset preset;
    ASSERT_TRUE(plugin->StorePreset(preset));
    preset.data = list("AZAB?", {1, 2, 3, 4, 5}).replace(8 + 4 * 68, 6, "Param3");
    takeTrace();
    EXPECT_TRUE(plugin->LoadPreset(preset));
    EXPECT_EQ(takeTrace().section("opcode-67; ", 1).remove("host-0: 0; "),
              QStringLiteral("set-parameter: 1 1; set-parameter: 3 3; set-parameter: 0 4; "
                             "set-parameter: 2 5; opcode-68"));
    EXPECT_TRUE(m_log.contains(QStringLiteral("Comp does not take the parameter Z")));
    EXPECT_FALSE(m_host.isIgnored(plugin.get()));
}

TEST_F(VSTPreset, WhatDoesNotBelongIsRefusedWithAReason)
{
    const QByteArray good = list("AB", {0, 1});
    const struct {
        const char *name;
        QByteArray data;
        int isChunk;
        const char *identifier;
        const char *reason;
    } cases[] = {{"of another", good, 0, "vst2:Comp:1001", "it is of vst2:Comp:1001"},
                 {"of another format", good, 0, "vst3:Comp:1000", "it is of vst3:"},
                 {"empty", {}, 0, "vst2:Comp:1000", "it holds no data"},
                 {"state for one that keeps none", good, 1, "vst2:Comp:1000", "no state of its own"},
                 {"of no kind", good, 2, "vst2:Comp:1000", "a kind that nobody knows"},
                 {"format 3", changed(good, 0, 3), 0, "vst2:Comp:1000", "no parameter list"},
                 {"huge count", changed(good, 7, '\x7F'), 0, "vst2:Comp:1000", "144 bytes for 2130706434"},
                 {"endless name", good.left(8) + QByteArray(64, 'A') + good.mid(72), 0, "vst2:Comp:1000",
                  "name of parameter 0 does not end"}};
    auto plugin = loaded("parameter A\nparameter B");
    PluginPreset preset;
    for (const auto &row : cases) {
        preset.data = row.data;
        preset.isChunk = row.isChunk;
        preset.identifier = QString::fromUtf8(row.identifier);
        EXPECT_FALSE(plugin->LoadPreset(preset)) << row.name;
        EXPECT_TRUE(m_log.lines().last().contains(QLatin1String(row.reason))) << row.name;
    }
    preset.isChunk = 0;
    for (int size = 0; size < good.size(); ++size) {
        preset.data = good.left(size);
        EXPECT_FALSE(plugin->LoadPreset(preset)) << size << " bytes of it";
    }
    EXPECT_EQ(takeTrace(), QString()) << "the plug-in heard of none";
    preset.data = good;
    EXPECT_TRUE(plugin->LoadPreset(preset)) << "the good one is good";
}

TEST_F(VSTPreset, TheUserIsToldAndSoIsTheLogOfAFailure)
{
    const auto ui = std::make_shared<NotingUI>();
    installVUI(ui);
    const struct {
        const char *name;
        const char *script;
    } cases[] = {{"State", "chunk abc\nfault set-chunk throw-std"},
                 {"Faulty", "chunk abc\nfault set-chunk segv"},
                 {"List", "parameter A\nfault set-parameter segv"}};
    for (const auto &row : cases) {
        const QString name = QString::fromUtf8(row.name);
        auto plugin = loaded(row.script, row.name);
        PluginPreset preset;
        EXPECT_TRUE(plugin->StorePreset(preset));
        EXPECT_FALSE(plugin->LoadPreset(preset)) << row.name;
        EXPECT_TRUE(m_log.contains(QStringLiteral("VST Plugin exception in ") + name));
        EXPECT_EQ(ui->heard, QStringList({"60000 Storing " + name + " Preset", "1000 ",
                                          "60000 Loading " + name + " Preset", "1000 "}));
        ui->heard.clear();
    }
    installVUI(nullptr);
}

TEST_F(VSTPreset, NamesOfParameters)
{
    auto plugin = loaded("parameter \"Gain  \"\nparameter \"\"\nparameter \" \" 0 Label\nparameter \" \"\n"
                         "parameter \"\" 0 \"Lab \"\nparameter \"  \"\nparameter \\xC9\\xFF\nparameter " +
                         QByteArray(128, 'n') + "\nparameter \"\" 0 Overlong!");
    const QStringList expected = {"Gain",
                                  "Param2",
                                  "Label",
                                  "Param4",
                                  "Lab",
                                  "",
                                  QString::fromUtf8("\xC3\x89\xC3\xBF"),
                                  QString(128, 'n'),
                                  "Overlong",
                                  "Param10"};
    for (int index = 0; index < expected.size(); ++index)
        EXPECT_EQ(plugin->parameterName(index), expected[index]) << index;
}
