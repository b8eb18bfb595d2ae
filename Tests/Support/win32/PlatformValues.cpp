#include "Tests/Support/PlatformValues.h"

const char *const kVst2Ending = ".dll";
const QString kBundleBinary = "%1.vst3/Contents/x86_64-win/%1.vst3";
const QString kBundlePath = kBundleBinary;
const char *const kForeignLocale = "German_Germany.1252";
const bool kHomeFollowsEnvironment = false;
const std::array<const char *, 2> kNamesLikeMarkup = {"Bad & worse", "sub&#13;/Bad&lt;/Path&gt;"};
const int kSystemsPlace = 1;
