#pragma once

#include "Core/BaseLib/Binary/LoadFailure.h"

/// Finds imported libraries as Windows does for a library that is loaded with `LoadLibraryW`: among the
/// loaded ones, beside the program, in the system's folders and in those of the search path. A folder that is
/// given comes first: the library's own, where it was loaded with `LOAD_LIBRARY_SEARCH_DLL_LOAD_DIR`.
LibrarySearch importSearch(const QString &firstFolder = QString());
