#include "Tests/Main/AudioEngineController/Effects/VST/VSTInstanceBench.h"

#include "Main/VLib/SimpleGUI.h"
#include "Tests/Support/NotingUI.h"

#include <QtEndian>

#include <cstring>
#include <limits>

namespace {

using VSTPreset = VSTInstanceBench;

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

} // namespace

TEST_F(VSTPreset, StoresStateOrParametersByteForByte)
{
    const QByteArray longName(63, 'n');
    const float nan = std::numeric_limits<float>::quiet_NaN();
    const struct {
        QByteArray script;
        QByteArray data; // "kept": nothing was stored
        bool isStored = false;
        int isChunk = 0;
    } cases[] = {{"chunk \"ab\\x00c\"", QByteArray("ab\0c", 4), true, 1},
                 {"flags 0x30\nparameter A", "kept"}, // no chunk
                 {"chunk a", {}},                     // one byte is none
                 {"chunk abc\nanswer get-chunk -5", "kept"},
                 {"chunk abc\nanswer get-chunk 2147483647", "kept"}, // more than there is
                 {"flags 0x30\nanswer get-chunk 3", "kept"},         // a null pointer
                 {"chunk abc\nfault get-chunk segv", "kept"},
                 {"", list({}, {}), true},
                 {"parameter A -1.5\nparameter B nan", list("AB", {-1.5f, nan}), true},
                 {"parameter " + longName + "x 1", list("A", {1.0f}).replace(8, 63, longName), true},
                 {"stated-parameters 2147483647", "kept"},
                 {"parameter A\nparameter B\nfault get-parameter segv", "kept"}};
    const auto ui = std::make_shared<NotingUI>();
    installVUI(ui);
    for (const auto &row : cases) {
        SCOPED_TRACE(row.script.constData());
        auto plugin = loaded(row.script + "\nname Comp\nid 7", qPrintable(QString::number(&row - cases)));
        PluginPreset preset;
        preset.data = "kept";
        EXPECT_EQ(plugin->StorePreset(preset), row.isStored);
        EXPECT_EQ(preset.data, row.data);
        EXPECT_EQ(preset.isChunk, row.isChunk);
        EXPECT_EQ(preset.identifier, row.data == "kept" ? "" : "vst2:Comp:7");
        EXPECT_EQ(plugin->LoadPreset(preset), row.isStored) << "and it is taken back";
    }
    installVUI(nullptr);
    EXPECT_EQ(ui->heard.mid(0, 4),
              QStringList({"60000 Storing Comp Preset", "1000 ", "60000 Loading Comp Preset", "1000 "}));
}

TEST_F(VSTPreset, RestoresParametersByNameAndTheSettingsOfTheObject)
{
    const QByteArray usual = "inputs 1\noutputs 6\nanswer opcode-51 1\nname Comp\n";
    auto plugin = loaded(usual);
    auto other = loaded(usual + "parameter B 9\nparameter A 9\nparameter \" \" 9\nparameter A 9\n"
                                "parameter C 9\nask-host set-parameter 0 index 1 opt 1",
                        "Other");
    ASSERT_TRUE(plugin->open(kSettings) && other->open(kSettings));
    plugin->setBypass(true);
    plugin->setRealtime(true);
    plugin->setOwnLatency(-300);
    PluginPreset preset;
    EXPECT_TRUE(plugin->StorePreset(preset));
    EXPECT_EQ(preset.flags, 300u << 16 | 7u);
    EXPECT_EQ(preset.firstChannels, (std::array<qint32, 2>{0, 0}));
    EXPECT_EQ(preset.channelSpans, (std::array<qint32, 2>{1, 6}));
    preset.data = list("AZAB?", {1, 2, 3, 4, 5}).replace(8 + 4 * 68, 6, "Param3");
    takeTrace();
    EXPECT_TRUE(other->LoadPreset(preset));
    EXPECT_EQ(takeTrace().section("opcode-67; ", 1).remove("host-0: 0; "),
              "set-parameter: 1 1; set-parameter: 3 3; set-parameter: 0 4; set-parameter: 2 5; opcode-68; "
              "opcode-44: 0 1");
    EXPECT_FALSE(VSTHostContext::instance().isIgnored(other.get()));
    EXPECT_TRUE(other->isBypassed() && other->isRealtime() && other->ownLatency() == 300);
}

TEST_F(VSTPreset, WhatDoesNotBelongIsRefused)
{
    const QByteArray good = list("AB", {0, 1});
    auto plugin = loaded("parameter A\nparameter B");
    const auto takes = [&](const QByteArray &data, int isChunk = 0, const char *id = "vst2:Comp:1000") {
        PluginPreset preset;
        preset.data = data;
        preset.isChunk = isChunk;
        preset.identifier = id;
        return plugin->LoadPreset(preset);
    };
    EXPECT_FALSE(takes(good, 0, "vst2:Comp:1001")) << "another's";
    EXPECT_FALSE(takes(good, 1)) << "a state, which it does not keep";
    EXPECT_FALSE(takes(good, 2)) << "an unknown kind";
    EXPECT_FALSE(takes(QByteArray(good).replace(0, 1, "3"))) << "another format";
    EXPECT_FALSE(takes(QByteArray(good).replace(7, 1, "\x7F"))) << "a huge count";
    EXPECT_FALSE(takes(good.left(8) + QByteArray(64, 'A') + good.mid(72))) << "a name without end";
    for (int size = 0; size < good.size(); ++size)
        EXPECT_FALSE(takes(good.left(size))) << size << " bytes of it";
    EXPECT_EQ(takeTrace(), QString()) << "the plug-in heard of none";
    EXPECT_TRUE(takes(good)) << "the good one is good";
    for (const char *script :
         {"chunk abc\nfault set-chunk throw-std", "parameter A\nfault set-parameter segv"}) {
        plugin.reset(); // the file is written anew
        plugin = loaded(script);
        PluginPreset preset;
        EXPECT_TRUE(plugin->StorePreset(preset));
        EXPECT_FALSE(plugin->LoadPreset(preset)) << script;
    }
}

TEST_F(VSTPreset, NamesOfParameters)
{
    auto plugin = loaded("parameter \"Gain  \"\nparameter \"\"\nparameter \" \" 0 Label\nparameter \"  \"\n"
                         "parameter \\xC9\\xFF\nparameter \"\" 0 Overlong!\nparameter " +
                         QByteArray(128, 'n'));
    QStringList names;
    for (int index = 0; index < 8; ++index)
        names << plugin->parameters().name(index);
    EXPECT_EQ(names, QStringList({"Gain", "Param2", "Label", "", QString::fromUtf8("\xC3\x89\xC3\xBF"),
                                  "Overlong", QString(128, 'n'), "Param8"}));
}
