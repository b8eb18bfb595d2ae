#pragma once

#include "Core/BaseLib/Binary/BinaryExports.h"

#include <QString>
#include <QStringList>

#include <optional>

/// What a module's file tells before anything of it is loaded.
struct ModuleInspection {
    enum class Verdict {
        Loadable,  ///< nothing speaks against loading it
        NoLibrary, ///< it starts with no header of a program library
        NoExport,  ///< it exports nothing of what was asked for
        Foreign,   ///< built for another machine or system
        CutShort,  ///< its headers speak of what is not there, or blank: a copy that has not ended, or broke
                   ///< off
        Unopened,  ///< the system does not let us read it
        Absent, ///< a bundle that holds none for this machine: made for others, or a copy that has not ended
    };

    Verdict verdict = Verdict::Loadable;
    QString reason; ///< a phrase about "it", with what helps, without the path; empty when it is loadable

    bool isLoadable() const { return verdict == Verdict::Loadable; }
};

/// Looks at a file: one open and a few reads. With names, a library that surely exports none of them is told
/// apart. Loading a file that is cut short would end the process at the first page that is not there, and at
/// the first table that is blank.
ModuleInspection inspectModule(const QString &path, const std::vector<QByteArray> &exports = {});

/// The same for the content of a file, which need not be trustworthy.
ModuleInspection inspectContent(ByteView file, const std::vector<QByteArray> &exports = {});

/// What differs from system to system. The forms of program libraries:
enum class LibraryForm { Elf, Pe };
/// The one that this system loads.
extern const LibraryForm kOwnForm;
/// The names of the libraries that the loader loads with this one; none when that is unreadable.
std::optional<QStringList> neededLibraries(ByteView file);
