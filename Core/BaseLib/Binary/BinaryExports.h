#pragma once

#include "Core/BaseLib/Binary/ByteView.h"

#include <QString>

#include <vector>

/// What a shared library's own tables say about the names that were asked for.
enum class ExportAnswer {
    Exported,    ///< it exports at least one of them
    NotExported, ///< it exports none of them
    Unknown      ///< the tables cannot be read or contradict themselves: only loading decides
};

/// Tells from its file, without running any of its code, whether a shared library exports one of these
/// symbols. Libraries that it depends on do not count. Reads PE libraries for any machine and, on Linux,
/// x86-64 ELF libraries; the answer for any other file, and for one that is missing, special or damaged, is
/// Unknown. Any thread may ask.
ExportAnswer findExports(const QString &path, const std::vector<QByteArray> &names);

/// The same for the content of such a file.
ExportAnswer findExports(ByteView file, const std::vector<QByteArray> &names);

/// The same for the content of a PE file, of any alignment, which need not be trustworthy.
ExportAnswer findPeExports(ByteView file, const std::vector<QByteArray> &names);
