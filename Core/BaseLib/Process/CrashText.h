#pragma once

#include <QtGlobal>

#include <array>
#include <cstddef>

/// Text that is put together while a process dies: without memory of its own, locks or calls of the run-time
/// library. What does not fit is left out.
class CrashText {
public:
    // Before the first line and before the others, so that they are told from what plug-ins print.
    static constexpr char kFirst = '\x1E'; ///< record separator (ASCII)
    static constexpr char kOther = '\x1F'; ///< unit separator (ASCII)

    CrashText &operator<<(const char *text)
    {
        for (; *text; ++text)
            add(*text);
        return *this;
    }
    CrashText &operator<<(quint64 number)
    {
        *this << "0x";
        bool isLeading = true;
        for (int shift = 60; shift >= 0; shift -= 4) {
            const auto digit = static_cast<std::size_t>(number >> shift & 0xF);
            isLeading &= digit == 0 && shift != 0;
            if (!isLeading)
                add("0123456789ABCDEF"[digit]);
        }
        return *this;
    }
    void add(char character)
    {
        if (m_size < m_text.size())
            m_text[m_size++] = character;
    }
    /// Copies the text, cut where it does not fit, with a zero behind it.
    void copyTo(char *target, std::size_t size) const
    {
        const std::size_t count = m_size < size ? m_size : size - 1;
        for (std::size_t index = 0; index < count; ++index)
            target[index] = m_text[index];
        target[count] = 0;
    }
    const char *data() const { return m_text.data(); }
    std::size_t size() const { return m_size; }

private:
    std::array<char, 2000> m_text{}; ///< below the size that pipes take as one (PIPE_BUF)
    std::size_t m_size = 0;
};

/// A place in the code of a process.
struct CrashPlace {
    quint64 address = 0;
    quint64 offset = 0;          ///< from the start of its module
    std::array<char, 64> name{}; ///< of the module, without its folder; empty: none is there
    bool isPlugin = false;       ///< the module is the one that is being asked

    friend CrashText &operator<<(CrashText &text, const CrashPlace &place)
    {
        if (place.name.front() == 0)
            return text << place.address;
        return text << place.name.data() << "+" << place.offset;
    }
};

/// As many frames as a description tells.
inline constexpr std::size_t kMaxCrashFrames = 15;
using CrashPlaces = std::array<CrashPlace, kMaxCrashFrames>;

/// The last component of a path, as much of it as fits.
inline void setName(CrashPlace &place, const char *path)
{
    const char *name = path;
    for (const char *each = path; *each; ++each)
        if (*each == '/' || *each == '\\')
            name = each + 1;
    for (std::size_t index = 0; index + 1 < place.name.size() && *name; ++index)
        place.name[index] = *name++;
}

/// The lines of a description: what happened and where, and the frames that led there.
inline CrashText crashText(const char *words, const CrashPlaces &frames, std::size_t count, bool isOwnThread)
{
    CrashText text;
    text << "\n";
    text.add(CrashText::kFirst);
    text << words;
    std::size_t caller = 0;
    while (caller < count && !frames[caller].isPlugin)
        ++caller;
    if (caller > 0 && caller < count) // the fault came up in another's code
        text << ", called from " << frames[caller];
    if (isOwnThread)
        text << ", in a thread of its own";
    text << "\n";
    for (std::size_t index = 0; index < count; ++index) {
        text.add(CrashText::kOther);
        text << frames[index] << "\n";
    }
    return text;
}
