#pragma once

// What tests of both systems expect, where the systems differ.

/// A locale that every machine has and that is not "C".
extern const char *const kForeignLocale;
/// A fault that ends the process also in a module's constructors and destructors. The loader of Windows
/// survives hardware faults there.
extern const char *const kLoaderKiller;
/// Whether the environment says where the home folder is. On Windows it is the user's profile, whatever that
/// says.
extern const bool kHomeFollowsEnvironment;
/// What the log says of a module file that is a text.
extern const char *const kTextFileReason;
