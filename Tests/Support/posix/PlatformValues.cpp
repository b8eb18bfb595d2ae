#include "Tests/Support/PlatformValues.h"

const char *const kVst2Ending = ".so";
const QString kBundleBinary = "%1.vst3/Contents/x86_64-linux/%1.so";
const QString kBundlePath = "%1.vst3";
const char *const kForeignLocale = "C.UTF-8";
const bool kHomeFollowsEnvironment = true;
const std::array<const char *, 2> kNamesLikeMarkup = {"Bad\r", "sub<br/Bad</Path>"};
const int kSystemsPlace = 0;
