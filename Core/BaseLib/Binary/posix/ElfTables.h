#pragma once

#include "Core/BaseLib/Binary/BinaryExports.h"

#include <QStringList>

#include <optional>

/// The tables in which the system's loader looks up a shared library's symbols. They point into the file.
struct ElfTables {
    ByteView symbols;       ///< up to the end of its segment: its own length is written nowhere
    ByteView strings;       ///< the symbols' names
    ByteView hash;          ///< the look-up table, up to the end of its segment
    bool isGnuHash = false; ///< the form of DT_GNU_HASH, which the loader prefers, or of DT_HASH
};

/// A table that takes more steps than this counts as unreadable, so that a hostile one does not keep the scan
/// busy; no honest library comes near it.
inline constexpr quint64 kMostElfSteps = 1 << 20;

/// Finds the tables of an x86-64 shared library by the program headers and the dynamic section, as the loader
/// does: a stripped library has no section headers. None when the file is something else, is cut short or
/// contradicts itself.
std::optional<ElfTables> readElfTables(ByteView file);

/// The libraries that a shared library needs, and the folders that it names for finding them.
struct ElfNeeds {
    QStringList libraries;
    /// As they stand there, with "$ORIGIN" and the like. The older form (DT_RPATH) counts for the libraries
    /// that are loaded with it as well, and not where there is the newer one (DT_RUNPATH).
    QStringList olderFolders, folders;
};

/// None when the file is not an x86-64 shared library, is cut short or contradicts itself.
std::optional<ElfNeeds> readElfNeeds(ByteView file);

/// Whether the content of an ELF file, of any alignment and not to be trusted, exports one of these symbols.
ExportAnswer findElfExports(ByteView file, const std::vector<QByteArray> &names);
