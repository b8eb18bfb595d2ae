#pragma once

#include "Main/AudioEngineController/Effects/VST/VSTDescription.h"

/// The parameters of a plug-in in use. One thread at a time.
class VSTParameters {
public:
    /// Both belong to the plug-in's object, which outlives this one.
    VSTParameters(VSTEffect &effect, const VSTNaming &naming)
        : m_effect(effect)
        , m_naming(naming)
    {}

    /// Nothing, with a log line, when the stated number cannot be.
    std::optional<VstInt32> count() const;
    /// The name as the plug-in has it, else "Param" and the number counted from 1.
    QString name(VstInt32 index) const;

private:
    VSTEffect &m_effect;
    const VSTNaming &m_naming;
};
