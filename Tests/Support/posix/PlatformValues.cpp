#include "Tests/Support/PlatformValues.h"

const char *const kVst2Ending = ".so";
const char *const kBundleFolder = "x86_64-linux";
const char *const kBundleEnding = ".so";
const bool kBundleIsThePlugin = true;
const char *const kForeignModule = "Contents/x86_64-win/Several.vst3";
const char *const kForeignLocale = "C.UTF-8";
const bool kHomeFollowsEnvironment = true;
const std::array<const char *, 2> kNamesLikeMarkup = {"Bad\r", "sub<br/Bad</Path>"};
const int kSystemsPlace = 0;
