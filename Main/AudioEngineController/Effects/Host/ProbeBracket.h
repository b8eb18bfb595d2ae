#pragma once

#include "Core/BaseLib/Process/ProcessState.h"
#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"

#include <QString>

class AudioPluginHost;

/// The bracket around one probe: a crash marker that is on disk from before the plug-in is touched until
/// after it was unloaded, and the process state that the plug-in may have changed, put back at the end. Lives
/// on the scan worker.
class ProbeBracket {
public:
    /// Writes the marker for the plug-in (path, file time and sub-plug-in identifier); a null name is made
    /// from its path. `state` must outlive the bracket.
    ProbeBracket(AudioPluginHost &host, const ProcessState &state, const EffectRecord &plugin,
                 const QString &name = QString());
    /// Puts the process state back and deletes the marker.
    ~ProbeBracket();
    ProbeBracket(const ProbeBracket &) = delete;
    ProbeBracket &operator=(const ProbeBracket &) = delete;

    /// Renews the marker's time stamp: whoever watches for a hanging probe sees that it goes on.
    void showProgress() const;

private:
    const ProcessState &m_state;
    QString m_marker;
};
