#include "Main/AudioEngineController/Effects/VST/VSTModuleFile.h"

QString VSTModuleFile::ending() { return QStringLiteral(".dll"); }
