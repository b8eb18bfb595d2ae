#include "Main/AudioEngineController/Effects/BusFormats/BusFormat.h"

#include <algorithm>
#include <sstream>

namespace {

constexpr bool kNamedOnly = false;
/// For plug-ins that know no such layout by name. The formats of eleven channels are not among them: what is
/// offered for eleven channels without a layout has twelve speakers.
constexpr bool kAlsoDiscrete = true;

struct Row {
    int code;
    const char *name;
    bool mayBeDiscrete;
    const char *labels; ///< between blanks
};

/// In each row: the bed with the surrounds from the sides to the rear, the wide pair, then the heights from
/// front to rear. The rows stand in the groups in which plug-ins with fewer channels are offered less.
constexpr Row kRows[] = {
    {1, "mono", kNamedOnly, "M"},
    {2, "stereo", kNamedOnly, "L R"},
    {3, "3.0", kNamedOnly, "L R C"},
    {4, "4.0 (music)", kNamedOnly, "L R Ls Rs"},
    {5, "5.0", kNamedOnly, "L R C Ls Rs"},
    {6, "5.1", kNamedOnly, "L R C LFE Ls Rs"},
    {7, "6.1 (cine)", kNamedOnly, "L R C LFE Ls Rs Cs"},
    {8, "7.0 (cine)", kNamedOnly, "L R C Ls Rs Lc Rc"},
    {9, "7.0 (music)", kNamedOnly, "L R C Lss Rss Lsr Rsr"},
    {10, "7.1 (cine)", kNamedOnly, "L R C LFE Ls Rs Lc Rc"},

    {50, "7.1.4", kAlsoDiscrete, "L R C LFE Lss Rss Lsr Rsr Ltf Rtf Ltr Rtr"},
    {60, "7.1.2", kAlsoDiscrete, "L R C LFE Lss Rss Lsr Rsr Ltm Rtm"},
    {61, "7.1.6", kAlsoDiscrete, "L R C LFE Lss Rss Lsr Rsr Ltf Rtf Ltm Rtm Ltr Rtr"},
    {62, "9.1.4", kAlsoDiscrete, "L R C LFE Lss Rss Lsr Rsr Lw Rw Ltf Rtf Ltr Rtr"},
    {63, "9.1.6", kAlsoDiscrete, "L R C LFE Lss Rss Lsr Rsr Lw Rw Ltf Rtf Ltm Rtm Ltr Rtr"},
    {64, "22.2", kAlsoDiscrete,
     "L R C LFE1 Lsr Rsr Lc Rc Cs LFE2 Lss Rss Ltf Rtf Ctf T Ltr Rtr Ltm Rtm Ctr Cbf Lbf Rbf"},

    {51, "11.1 (MPEG)", kAlsoDiscrete, "L R C LFE Lss Rss Lsr Rsr Ltf Rtf Ltr Rtr"},
    {52, "7.0.4", kNamedOnly, "L R C Lss Rss Lsr Rsr Ltf Rtf Ltr Rtr"},
    {53, "7.0.6", kAlsoDiscrete, "L R C Lss Rss Lsr Rsr Ltf Rtf Ltm Rtm Ltr Rtr"},
    {56, "9.0.4", kAlsoDiscrete, "L R C Lss Rss Lsr Rsr Lw Rw Ltf Rtf Ltr Rtr"},
    {57, "9.0.6", kAlsoDiscrete, "L R C Lss Rss Lsr Rsr Lw Rw Ltf Rtf Ltm Rtm Ltr Rtr"},

    {54, "7.1 (cine, side high)", kAlsoDiscrete, "L R C LFE Ls Rs Ltm Rtm"},
    {55, "5.0.4", kAlsoDiscrete, "L R C Ls Rs Ltf Rtf Ltr Rtr"},
    {58, "5.1.4", kAlsoDiscrete, "L R C LFE Ls Rs Ltf Rtf Ltr Rtr"},
    {59, "7.0.2", kAlsoDiscrete, "L R C Lss Rss Lsr Rsr Ltm Rtm"},
    {65, "ambisonics, 1st order", kAlsoDiscrete, "ACN0 ACN1 ACN2 ACN3"},
    {66, "ambisonics, 2nd order", kAlsoDiscrete, "ACN0 ACN1 ACN2 ACN3 ACN4 ACN5 ACN6 ACN7 ACN8"},
    {67, "ambisonics, 3rd order", kAlsoDiscrete,
     "ACN0 ACN1 ACN2 ACN3 ACN4 ACN5 ACN6 ACN7 ACN8 ACN9 ACN10 ACN11 ACN12 ACN13 ACN14 ACN15"},

    {70, "10.1", kNamedOnly, "L R C LFE Ls Rs Ltf Rtf Ltr Rtr T"},
    {71, "11.1", kAlsoDiscrete, "L R C LFE Ls Rs Ltf Ctf Rtf Ltr Rtr T"},
    {72, "13.1", kAlsoDiscrete, "L R C LFE Lss Rss Lsr Rsr Ltf Ctf Rtf Ltr Rtr T"},
};

std::vector<BusFormat> formatsOfRows()
{
    std::vector<BusFormat> formats;
    for (const Row &row : kRows) {
        BusFormat &format = formats.emplace_back(BusFormat{row.code, row.name, row.mayBeDiscrete, {}});
        std::istringstream labels(row.labels);
        for (std::string label; labels >> label;)
            format.labels.push_back(label);
    }
    return formats;
}

} // namespace

const std::vector<BusFormat> &busFormats()
{
    static const std::vector<BusFormat> formats = formatsOfRows();
    return formats;
}

const BusFormat *findBusFormat(int code)
{
    const auto &formats = busFormats();
    const auto format = std::find_if(formats.begin(), formats.end(),
                                     [code](const BusFormat &candidate) { return candidate.code == code; });
    return format == formats.end() ? nullptr : &*format;
}

std::vector<const BusFormat *> busFormatsOfChannels(int channels)
{
    std::vector<const BusFormat *> found;
    for (const BusFormat &format : busFormats())
        if (format.channels() == channels)
            found.push_back(&format);
    return found;
}
