#include "Main/AudioEngineController/Effects/VST3/VST3Speakers.h"
#include "Main/AudioEngineController/Effects/BusFormats/BusFormat.h"
#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/QtPrinters.h"

#include <gtest/gtest.h>

using namespace Steinberg::Vst;

namespace {

/// The speakers that a code gives, and the plug-in's channels of the positions from 0 on, one digit ("0" to
/// "n") for each; before, position 1 went to channel 7.
void expectSpeakers(int code, SpeakerArrangement speakers, const std::string &channels)
{
    VST3ChannelMap map = {{1, 7}};
    EXPECT_EQ(arrangementFor(code, map, {}), speakers) << code;
    std::string found;
    for (const auto &[position, channel] : map)
        found += "0123456789abcdefghijklmn"[channel];
    EXPECT_EQ(found, channels) << code;
}

} // namespace

TEST(VST3Speakers, OfEveryBusFormat)
{
    // Code, bits of the SDK's vstspeaker.h in hexadecimal digits, channels.
    const QStringList rows = QString(R"(
1 80000 0, 2 3 01, 3 7 012, 4 33 0123, 5 37 01234, 6 3f 012345, 7 13f 0123456, 8 f7 0123456,
9 637 0125634, 10 ff 01234567, 50 2d63f 0123674589ab, 51 2d63f 0123674589ab, 52 2d637 0125634789a,
53 302d637 012563478bc9a, 54 300003f 01234567, 55 2d037 012345678, 56 2d6f7 0127834569abc,
57 302d6f7 0127834569adebc, 58 2d03f 0123456789, 59 3000637 012563478, 60 300063f 0123674589,
61 302d63f 0123674589cdab, 62 2d6ff 0123894567abcd, 63 302d6ff 0123894567abefcd,
64 7307ffff 012345678i9acedbfhjkgmln, 65 f00000 0123, 66 7c000f00000 012345678,
67 3ffc000f00000 0123456789abcdef, 70 2d83f 012345789a6, 71 2f83f 012345789ab6,
72 2fe3f 012367459abcd8)")
                                 .split(',');
    for (const QString &row : rows) {
        const QStringList words = row.simplified().split(' ');
        expectSpeakers(words[0].toInt(), words[1].toULongLong(nullptr, 16), words[2].toStdString());
    }
    EXPECT_EQ(std::size_t(rows.size()), busFormats().size());
    // Of so many discrete channels, and of no format.
    expectSpeakers(0x100, 0, "7");
    expectSpeakers(0x101, 0x80000, "07");
    expectSpeakers(0x104, 0x107, "0123");
    expectSpeakers(0x118, 0x7307FFFF, "0123456789abcdefghijklmn");
    for (const int none : {-1, 11, 0x119, 0x7FFFFFFF})
        expectSpeakers(none, 3, "7");
}

TEST(VST3Speakers, AreLimitedForPluginsOfFewChannels)
{
    const struct {
        int code, limit, speakers;
        bool isLimited;
    } rows[] = {{50, 12, 0x2D63F, false}, {50, 0, 0x2D63F, false}, {50, 10, 0x300063F, true},
                {51, 10, 0x2D63F, false}, {72, 10, 0x2D03F, true}, {57, 12, 0x2D63F, true},
                {60, 7, 0x63F, true},     {60, -1, 0x63F, true},   {10, 6, 0x3F, true},
                {10, 5, 0x37, true},      {10, 4, 0x107, true},    {10, 3, 0x7, true},
                {2, 1, 0x80000, true},    {0x108, 2, 0xFF, false}};
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
