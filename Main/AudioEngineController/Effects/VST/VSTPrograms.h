#pragma once

#include "Main/AudioEngineController/Effects/VST/Interface/VSTEffect.h"

#include <QString>

/// The programs of a plug-in in use.
class VSTPrograms {
public:
    /// The effect belongs to the plug-in's object, which outlives this one.
    explicit VSTPrograms(VSTEffect &effect)
        : m_effect(effect)
    {}

    /// 0 when the plug-in states a negative number.
    VstInt32 count() const;
    /// Makes a program the current one; false when it is not there.
    bool set(VstInt32 index);
    /// Of the current program.
    QString name();

private:
    VSTEffect &m_effect;
};
