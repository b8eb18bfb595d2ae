#include "Main/AudioEngineController/Effects/Host/ProbeBracket.h"

#include "Core/BaseLib/Files/FileTime.h"
#include "Core/BaseLib/Process/PluginThread.h"
#include "Main/AudioEngineController/Effects/Host/AudioPluginHost.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"

#include <QCoreApplication>

ProbeBracket::ProbeBracket(AudioPluginHost &host, const ProcessState &state, const EffectRecord &plugin,
                           const QString &name)
    : m_state(state)
    , m_marker(host.WriteCrashMarker(plugin, name))
{}

ProbeBracket::~ProbeBracket()
{
    // Events that the plug-in left for this thread lead into its code: they come while its marker still
    // stands.
    QCoreApplication::processEvents();
    PluginThread::deliverMessages();
    m_state.restore();
    ActiveMarkers::remove(m_marker);
}

void ProbeBracket::showProgress() const { touchFile(m_marker); }
