#pragma once

#include <QString>

#include <cstring>

/// Longest text of a plug-in, in bytes; what is longer is cut.
inline constexpr std::size_t kMaxClapText = 4096;

/// A text that a plug-in hands out: none for null, cut where it is too long; invalid UTF-8 is replaced.
inline QString clapText(const char *text)
{
    return text ? QString::fromUtf8(text, static_cast<int>(strnlen(text, kMaxClapText))) : QString();
}
