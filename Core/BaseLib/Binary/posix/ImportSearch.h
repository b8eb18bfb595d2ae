#pragma once

#include "Core/BaseLib/Binary/LoadFailure.h"

/// Finds needed libraries as the loader does for the library at a path: among the loaded ones, in the folders
/// that the library names, in those of LD_LIBRARY_PATH and where the system's cache has them. Those that the
/// system knows count as known to load.
LibrarySearch importSearch(const QString &path);

/// The same of those only that lie in a folder which a library or LD_LIBRARY_PATH names; all others count as
/// known to load. Quick where none is named.
LibrarySearch namedFolderSearch(const QString &path);
