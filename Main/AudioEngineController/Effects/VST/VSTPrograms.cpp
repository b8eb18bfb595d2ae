#include "Main/AudioEngineController/Effects/VST/VSTPrograms.h"

#include <algorithm>

namespace {

/// Interfaces state 24 bytes for the name of a program; plug-ins write more.
constexpr int kNameSize = 256;

} // namespace

VstInt32 VSTPrograms::count() const
{
    return std::max(m_effect.fields().value_or(VSTEffect::Fields{}).numPrograms, 0);
}

bool VSTPrograms::set(VstInt32 index)
{
    return index >= 0 && index < count() && m_effect.send(VstPublished::effBeginSetProgram) &&
           m_effect.sendValue(effSetProgram, index) && m_effect.send(VstPublished::effEndSetProgram);
}

QString VSTPrograms::name()
{
    if (!m_effect.isCallable())
        return QString();
    return QString::fromLatin1(m_effect.dispatchText(effGetProgramName, kNameSize).bytes);
}
