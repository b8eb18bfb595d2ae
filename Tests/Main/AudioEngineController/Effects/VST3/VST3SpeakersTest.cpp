#include "Main/AudioEngineController/Effects/VST3/VST3Speakers.h"
#include "Main/AudioEngineController/Effects/BusFormats/BusFormat.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

using namespace Steinberg::Vst;

namespace {

/// The speakers that a code gives, and the plug-in's channels of the positions from 0 on; before, position 1
/// went to channel 7.
void expectSpeakers(int code, SpeakerArrangement speakers, const std::string &channels)
{
    SCOPED_TRACE(code);
    VST3ChannelMap map = {{1, 7}};
    EXPECT_EQ(arrangementFor(code, map, {}), speakers);
    std::string text;
    for (const auto &[position, channel] : map)
        text += (text.empty() ? "" : " ") + std::to_string(channel);
    EXPECT_EQ(text, channels);
}

} // namespace

TEST(VST3Speakers, OfEveryBusFormat)
{
    using namespace SpeakerArr;
    const std::pair<int, SpeakerArrangement> inOrder[] = {
        {1, kMono},  {2, kStereo}, {3, k30Cine},           {4, k40Music},          {5, k50},
        {6, k51},    {7, k61Cine}, {8, k70Cine},           {10, k71Cine},          {54, k71CineSideHigh},
        {55, k50_4}, {58, k51_4},  {65, kAmbi1stOrderACN}, {66, kAmbi2cdOrderACN}, {67, kAmbi3rdOrderACN}};
    for (const auto &[code, speakers] : inOrder) {
        std::string channels = "0";
        for (int channel = 1; channel < getChannelCount(speakers); ++channel)
            channels += ' ' + std::to_string(channel);
        expectSpeakers(code, speakers, channels);
    }
    const struct {
        int code;
        SpeakerArrangement speakers;
        const char *channels;
    } reordered[] = {{9, k70Music, "0 1 2 5 6 3 4"},
                     {50, k71_4, "0 1 2 3 6 7 4 5 8 9 10 11"},
                     {51, k111MPEG3D, "0 1 2 3 6 7 4 5 8 9 10 11"},
                     {52, k70_4, "0 1 2 5 6 3 4 7 8 9 10"},
                     {53, k70_6, "0 1 2 5 6 3 4 7 8 11 12 9 10"},
                     {56, k90_4, "0 1 2 7 8 3 4 5 6 9 10 11 12"},
                     {57, k90_6, "0 1 2 7 8 3 4 5 6 9 10 13 14 11 12"},
                     {59, k70_2, "0 1 2 5 6 3 4 7 8"},
                     {60, k71_2, "0 1 2 3 6 7 4 5 8 9"},
                     {61, k71_6, "0 1 2 3 6 7 4 5 8 9 12 13 10 11"},
                     {62, k91_4, "0 1 2 3 8 9 4 5 6 7 10 11 12 13"},
                     {63, k91_6, "0 1 2 3 8 9 4 5 6 7 10 11 14 15 12 13"},
                     {64, k222, "0 1 2 3 4 5 6 7 8 18 9 10 12 14 13 11 15 17 19 20 16 22 21 23"},
                     {70, k101, "0 1 2 3 4 5 7 8 9 10 6"},
                     {71, k111, "0 1 2 3 4 5 7 8 9 10 11 6"},
                     {72, k131, "0 1 2 3 6 7 4 5 9 10 11 12 13 8"}};
    for (const auto &row : reordered)
        expectSpeakers(row.code, row.speakers, row.channels);
    EXPECT_EQ(std::size(inOrder) + std::size(reordered), busFormats().size());
}

TEST(VST3Speakers, OfDiscreteChannelsAndOfNoFormat)
{
    expectSpeakers(0x100, 0, "7");
    expectSpeakers(0x101, 0x80000, "0 7");
    expectSpeakers(0x104, 0x107, "0 1 2 3");
    expectSpeakers(0x10B, 0x2F83F, "0 1 2 3 4 5 6 7 8 9 10");
    expectSpeakers(0x115, 0x302D6FF, "0 1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16 17 18 19 20");
    expectSpeakers(0x118, 0x7307FFFF, "0 1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16 17 18 19 20 21 22 23");
    for (const int none : {-1, 11, 0x119, 0x200, 0x7FFFFFFF})
        expectSpeakers(none, 3, "7");
}

TEST(VST3Speakers, AreLimitedForPluginsOfFewChannels)
{
    const struct {
        int code, limit, speakers;
        bool isLimited;
    } rows[] = {{50, 12, 0x2D63F, false},  {50, 13, 0x2D63F, false},  {50, 0, 0x2D63F, false},
                {50, 10, 0x300063F, true}, {64, 10, 0x300063F, true}, {51, 10, 0x2D63F, false},
                {72, 10, 0x2D03F, true},   {57, 12, 0x2D63F, true},   {60, 7, 0x63F, true},
                {60, -1, 0x63F, true},     {10, 6, 0x3F, true},       {10, 5, 0x37, true},
                {10, 4, 0x107, true},      {10, 3, 0x7, true},        {10, 2, 0x3, true},
                {2, 1, 0x80000, true},     {0x108, 2, 0xFF, false}};
    for (const auto &row : rows) {
        const CapturedLog log;
        VST3ChannelMap map;
        EXPECT_EQ(arrangementFor(row.code, map, {row.limit}), SpeakerArrangement(row.speakers))
            << row.code << ' ' << row.limit;
        const QString line =
            QStringLiteral("LIMIT SPEAKER ARRANGEMENT FOR %1 to %2").arg(row.code).arg(row.speakers);
        EXPECT_EQ(log.lines(), row.isLimited ? QStringList(line) : QStringList());
    }
    EXPECT_EQ(limitedArrangement(67, 10), 0u);
}
