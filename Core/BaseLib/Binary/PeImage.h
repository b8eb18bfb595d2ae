#pragma once

#include "Core/BaseLib/Binary/BinaryExports.h"
#include "Core/BaseLib/Binary/ByteView.h"
#include "Core/BaseLib/Binary/LoadedParts.h"
#include "Core/BaseLib/Binary/PeFormat.h"

#include <QStringList>

#include <optional>

/// The content of a PE file, a Windows program or library for any machine, read without running any of its
/// code. Points into the bytes that it was read from, which may come from a hostile file: what contradicts
/// itself or lies outside of them counts as unreadable.
class PeImage {
public:
    /// None when the bytes do not start with the headers of a PE file.
    static std::optional<PeImage> read(ByteView file);

    /// The processor it was built for, as the file header has it (IMAGE_FILE_MACHINE_...).
    quint16 machine() const { return m_machine; }
    /// Whether all that the loader would take from the file is there. The tables of other files are all
    /// unreadable.
    bool isComplete() const { return m_isComplete; }
    /// Whether a table that is there has only zeros where its first entry must be.
    bool isBlank() const;

    /// Whether it exports one of these names. A forwarder to another library counts, an export that has only
    /// a number does not.
    ExportAnswer findExports(const std::vector<QByteArray> &names) const;
    /// The names of the libraries that the loader loads with it, in the order of the table; none when that is
    /// unreadable.
    std::optional<QStringList> imports() const;
    /// The names of the libraries that are loaded when one of their functions is called for the first time,
    /// in the order of the table; none when that is unreadable.
    std::optional<QStringList> delayImports() const;

private:
    bool addParts(ByteView file, const PeOptionalHeader &header, ByteView sections, quint16 sectionCount);
    PeDirectory directory(quint32 index) const;
    /// Whether the name at an index of the export tables is exported and one of these.
    ExportAnswer answerAt(const PeExports &table, quint64 index, const std::vector<QByteArray> &names) const;
    template <typename Entry>
    std::optional<QStringList> libraries(quint32 directoryIndex) const;

    quint16 m_machine = 0;
    bool m_isComplete = false;
    ByteView m_directories;
    LoadedParts m_parts;
};
