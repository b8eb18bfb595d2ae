#pragma once

#include "Core/BaseLib/Binary/ByteView.h"

#include <optional>

/// More steps than any honest library needs along one of its tables; a table that asks for more is taken as
/// unreadable, so that a hostile one does not keep the scan busy.
inline constexpr quint64 kMostElfSteps = 1 << 20;

/// The tables in which the system's loader looks up a shared library's symbols. They point into the file.
struct ElfTables {
    ByteView symbols;       ///< up to the end of its segment: its own length is written nowhere
    ByteView strings;       ///< the symbols' names
    ByteView hash;          ///< the look-up table, up to the end of its segment
    bool isGnuHash = false; ///< the form of DT_GNU_HASH, which the loader prefers, or of DT_HASH
};

/// Finds the tables of an x86-64 shared library, by the program headers and the dynamic section as the loader
/// does: a stripped library has no section headers. None when the file is something else, is cut short or
/// contradicts itself.
std::optional<ElfTables> readElfTables(ByteView file);
