// A library that loads well and has nothing of a plug-in.

#include <pluginterfaces/base/fplatform.h>

extern "C" SMTG_EXPORT_SYMBOL int unrelatedFunction() { return 1; }
