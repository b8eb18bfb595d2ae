#pragma once

#include <array>

// What tests of both systems expect, where the systems differ.

/// What the names of VST 2 modules end in.
extern const char *const kVst2Ending;
/// The folder of a bundle that holds the module, and what the module's name ends in.
extern const char *const kBundleFolder;
extern const char *const kBundleEnding;
/// Whether the scan takes the bundle for the plug-in, or the module in it.
extern const bool kBundleIsThePlugin;
/// Where a bundle "Several" holds the module for the other system.
extern const char *const kForeignModule;

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
