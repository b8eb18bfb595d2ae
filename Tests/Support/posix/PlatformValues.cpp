#include "Tests/Support/PlatformValues.h"

const char *const kForeignLocale = "C.UTF-8";
const char *const kLoaderKiller = "segv";
const bool kHomeFollowsEnvironment = true;
const char *const kTextFileReason = "file too short";
