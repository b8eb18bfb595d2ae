#pragma once

#include <QString>

#include <array>

// What tests of both systems expect, where the systems differ.

/// What the names of VST 2 modules end in.
extern const char *const kVst2Ending;
/// Where a bundle "%1" holds its module, and the path that a scan records.
extern const QString kBundleBinary;
extern const QString kBundlePath;

/// A locale that every machine has and that is not "C".
extern const char *const kForeignLocale;
/// Whether the environment says where the home folder is. On Windows it is the user's profile, whatever that
/// says.
extern const bool kHomeFollowsEnvironment;
/// Which of two values "Linux/Windows" in a table counts.
extern const int kSystemsPlace;
/// Names of modules, as far as the system allows them, that upset a reader of markup; one lies in a
/// subfolder.
extern const std::array<const char *, 2> kNamesLikeMarkup;
