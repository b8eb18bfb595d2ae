#include "Tests/Support/PlatformValues.h"

const char *const kVst2Ending = ".dll";
const char *const kBundleFolder = "x86_64-win";
const char *const kBundleEnding = ".vst3";
const bool kBundleIsThePlugin = false;
const char *const kForeignModule = "Contents/x86_64-linux/Several.so";
const char *const kForeignLocale = "German_Germany.1252";
const bool kHomeFollowsEnvironment = false;
const std::array<const char *, 2> kNamesLikeMarkup = {"Bad & worse", "sub&#13;/Bad&lt;/Path&gt;"};
const int kSystemsPlace = 1;
