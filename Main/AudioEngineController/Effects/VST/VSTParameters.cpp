#include "Main/AudioEngineController/Effects/VST/VSTParameters.h"

#include "Core/BaseLib/Log/DebugLog.h"

#include <cstddef>
#include <cstring>

namespace {

namespace vst = VstPublished;

/// More parameters than any plug-in has. One that states more is not believed, and not stored in part either.
constexpr VstInt32 kMaxParameters = 0x10000;
constexpr int kNameSize = 128;

/// The short label among a parameter's properties, read from a buffer that the plug-in filled.
QByteArray shortLabel(const QByteArray &properties)
{
    constexpr int kSize = sizeof(vst::VstParameterProperties::shortLabel);
    const char *label = properties.constData() + offsetof(vst::VstParameterProperties, shortLabel);
    return QByteArray(label, static_cast<int>(strnlen(label, kSize)));
}

} // namespace

std::optional<VstInt32> VSTParameters::count() const
{
    const VstInt32 stated = m_effect.fields().value_or(VSTEffect::Fields{}).numParams;
    if (stated >= 0 && stated <= kMaxParameters)
        return stated;
    DebugLog(L"%ls states %d parameters, which cannot be", m_naming.name, stated);
    return std::nullopt;
}

QString VSTParameters::name(VstInt32 index) const
{
    QByteArray text;
    if (m_effect.isCallable())
        text = m_effect.textAt(effGetParamName, index, kNameSize);
    if (text.isEmpty() || text == " ") {
        const QByteArray properties =
            m_effect.isCallable() ? m_effect.parameterProperties(index) : QByteArray();
        text = properties.isNull() ? "Param" + QByteArray::number(qint64(index) + 1) : shortLabel(properties);
    }
    while (text.endsWith(' '))
        text.chop(1);
    return QString::fromLatin1(text);
}
