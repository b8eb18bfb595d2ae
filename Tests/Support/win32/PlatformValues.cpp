#include "Tests/Support/PlatformValues.h"

const char *const kForeignLocale = "German_Germany.1252";
const char *const kLoaderKiller = "abort";
const bool kHomeFollowsEnvironment = false;
const char *const kTextFileReason = "the file is no Windows library";
