#pragma once

#include "Main/AudioEngineController/Effects/Plugin/PluginPreset.h"
#include "Main/AudioEngineController/Effects/VST/VSTParameters.h"

#include <QStringList>

#include <deque>
#include <map>

struct VSTStoredParameter;

/// Captures the state of a plug-in in use, and brings it back: the plug-in's own state where it keeps one,
/// else the values of its parameters. One thread at a time.
class VSTPresets {
public:
    /// All belong to the plug-in's object, which outlives this one.
    VSTPresets(VSTEffect &effect, const VSTNaming &naming, const VSTParameters &parameters)
        : m_effect(effect)
        , m_naming(naming)
        , m_parameters(parameters)
    {}

    /// Fills in the data and its kind. False when the preset is not to be made; true without data when a
    /// plug-in has none to give.
    bool capture(PluginPreset &preset);
    /// False, with the reason in the log, when the plug-in did not take the preset, or the preset bears none
    /// of the identifiers or is damaged. The plug-in is not called then.
    bool restore(const PluginPreset &preset, const QStringList &identifiers);

private:
    bool keepsState() const;
    bool captureState(PluginPreset &preset);
    bool captureParameters(PluginPreset &preset);
    QString reasonAgainst(const PluginPreset &preset, const QStringList &identifiers) const;
    bool restoreState(const QByteArray &data);
    bool restoreParameters(const std::vector<VSTStoredParameter> &stored);
    bool setParameters(const std::vector<VSTStoredParameter> &stored,
                       std::map<QByteArray, std::deque<VstInt32>> &indexes);

    VSTEffect &m_effect;
    const VSTNaming &m_naming;
    const VSTParameters &m_parameters;
};
