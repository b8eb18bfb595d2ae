#include "Main/AudioEngineController/Effects/VST/Interface/VSTSpeakers.h"
#include "Tests/Main/AudioEngineController/Effects/VST/VSTInstanceBench.h"
#include "Tests/Support/QtPrinters.h"

#include <map>
#include <sstream>

namespace {

/// "TYPE(SPEAKERS)", as a trace shows it.
std::string textOf(const VSTSpeakerArrangement &arrangement)
{
    std::string text;
    for (int index = 0; index < arrangement.numChannels; ++index)
        text += (index ? " " : "") + std::to_string(arrangement.speakers[index].type);
    return std::to_string(arrangement.type) + '(' + text + ')';
}

using VSTSpeakers = VSTInstanceBench;

} // namespace

TEST_F(VSTSpeakers, OfEveryBusFormat)
{
    const std::map<int, const char *> told = {
        {6, "15(1 2 3 4 5 6)"},
        {57, "-2(1 2 3 10 11 5 6 -2 -2 13 15 13 15 16 18)"},
        {64, "-2(1 2 3 4 5 6 -2 -2 -2 19 10 11 13 15 -2 12 16 18 13 15 -2 -2 -2 -2)"},
        {72, "-2(1 2 3 4 10 11 5 6 13 -2 15 16 18 12)"}};
    QStringList ready;
    testing::internal::CaptureStdout();
    for (const BusFormat &format : busFormats()) {
        const VSTSpeakerArrangement arrangement = vstArrangement(format);
        const auto row = told.find(format.code);
        EXPECT_TRUE(row == told.end() || row->second == textOf(arrangement)) << format.name;
        EXPECT_EQ(arrangement.type == -2, format.code >= 50) << "no number of its own: " << format.name;
        EXPECT_EQ(arrangement.numChannels, format.channels()) << format.name;
    }
    for (int channels = -1; channels <= 37; ++channels)
        if (const VSTSpeakerArrangement *found = VSTHostContext::instance().findArrangement(channels))
            ready << QStringLiteral("%1:%2").arg(found->numChannels).arg(found->type);
    const std::string printed = testing::internal::GetCapturedStdout();
    EXPECT_EQ(ready.join(' '), "1:0 2:1 3:6 4:11 5:14 6:15 7:18 8:22 9:-2 10:-2 11:-2 12:-2 "
                               "13:-2 14:-2 15:-2 16:-2 24:-2");
    EXPECT_NE(printed.find("Speaker: 0M\nFound arrangement for:2 chs:2 type:1\nSpeaker: 0L\nSpeaker: 1R\n"),
              std::string::npos);
    std::istringstream rows("M+30 1 M-30 2 M+0 3 M+110 5 M-110 6 M+90 10 M-90 11 M+135 5 M-135 6 U+45 13 "
                            "U-45 15 U+90 13 U-90 15 U+135 16 U-135 18 U+0 12 l -2 LS -2 \"\" -2");
    std::string label;
    for (int type = 0; rows >> label >> type;)
        EXPECT_EQ(vstSpeakerType(label), type) << label;
}

TEST_F(VSTSpeakers, AreToldOnceAndAgainWhenTheChannelsChange)
{
    // Step; the script, or "-" for the plug-in of the step before; inputs, outputs, whether it is forced,
    // whether it is accepted; the calls; the line of the counts.
    const char *const steps = R"(
stereo ~ ~ 2 2 0 1 ~ 1(1 2) -> 1(1 2) ~ 2,2 | 2,2 | (2,2
unchanged ~ - ~ 2 2 0 1 ~ ~
forced ~ - ~ 2 2 1 1 ~ 1(1 2) -> 1(1 2) ~ 2,2 | 2,2 | (2,2
the plug-in's inputs where it has its own outputs ~ inputs 1 / outputs 2 ~ 2 2 0 1 ~ 0(-2) -> 1(1 2) ~ 2,2 | 2,2 | (1,2
as asked where neither is ~ inputs 1 / outputs 6 ~ 2 2 0 1 ~ 1(1 2) -> 1(1 2) ~ 2,2 | 2,2 | (1,6
an instrument ~ inputs 0 / outputs 2 ~ 2 2 0 1 ~ -1() -> 1(1 2) ~ 2,2 | 2,2 | (0,2
a layout of its own ~ name "Comp VisLM" / inputs 10 / outputs 2 ~ 2 2 0 1 ~ 22(1 2 3 4 5 6 -2 -2) -> 1(1 2) ~ 2,2 | 8,2 | (10,2
no format of the inputs ~ ~ 17 2 0 0 ~ ~ 17,2 | 17,2 | (2,2
more than there is room for ~ ~ 2 37 0 0 ~ ~ 2,37 | 2,37 | (2,2
refuses all ~ inputs 7 / outputs 7 / answer set-speaker-arrangement 0 ~ 7 7 0 0 ~ 18(1 2 3 4 5 6 -2) -> 18(1 2 3 4 5 6 -2); 20(1 2 3 5 6 -2 -2) -> 20(1 2 3 5 6 -2 -2); 21(1 2 3 10 11 5 6) -> 21(1 2 3 10 11 5 6); -2(-2 -2 -2 -2 -2 -2 -2) -> -2(-2 -2 -2 -2 -2 -2 -2) ~ 7,7 | 7,7 | (7,7
and is not asked again ~ - ~ 7 7 0 0 ~ ~
throws ~ fault set-speaker-arrangement throw-std ~ 2 2 0 0 ~ 1(1 2) -> 1(1 2) ~ 2,2 | 2,2 | (2,2
says that they changed ~ ask-host set-speaker-arrangement 13 ~ 2 2 0 1 ~ 1(1 2) -> 1(1 2); host-13: 0 ~ 2,2 | 2,2 | (2,2
said so only because it was told ~ - ~ 2 2 0 1 ~ ~
changes its channels ~ set set-speaker-arrangement outputs 4 / ask-host opcode-2 13 ~ 2 2 0 1 ~ 1(1 2) -> 1(1 2) ~ 2,2 | 2,2 | (2,2
changed ~ - ~ 2 2 0 1 ~ 1(1 2) -> 1(1 2) ~ 2,2 | 2,2 | (2,4
says so when a program is set ~ - ~ 2 2 0 1 ~ 1(1 2) -> 1(1 2) ~ 2,2 | 2,2 | (2,4
)";
    std::unique_ptr<VSTPlugin> plugin;
    for (const QStringList &step : rowsOf(steps)) {
        SCOPED_TRACE(step[0].toStdString());
        if (step[1] != "-") {
            plugin.reset(); // the file is written anew
            plugin = loaded(scriptIn(step[1]));
            ASSERT_TRUE(plugin->open(kSettings));
        }
        const bool setsProgram = step[0].contains("program");
        EXPECT_EQ(setsProgram && plugin->programs().set(0), setsProgram);
        takeTrace();
        const QStringList numbers = step[2].split(' ');
        testing::internal::CaptureStdout();
        EXPECT_EQ(plugin->UpdateSpeakerArrangement(numbers[0].toInt(), numbers[1].toInt(), numbers[2] == "1"),
                  numbers[3] == "1");
        const QString printed = QString::fromStdString(testing::internal::GetCapturedStdout());
        EXPECT_EQ(printed.section('\n', 0, 0).remove("USA: "), step[4]);
        EXPECT_EQ(takeTrace().remove(QRegularExpression("set-speaker-arrangement[^:]*: ")), step[3]);
    }
    EXPECT_EQ(plugin->channels().outputs.span(), 4);
    EXPECT_EQ(m_log.count("Exception Caught in VST Plugin"), 1);
    EXPECT_EQ(vstFallbackArrangements(36, 36).size(), 1u) << "large layouts have only numbers";
}
