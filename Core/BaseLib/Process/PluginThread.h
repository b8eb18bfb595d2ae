#pragma once

#include <thread>

/// Makes the calling thread one that plug-ins can run on, for as long as the object lives: on Windows they
/// rely on a COM apartment of a single thread, and a plug-in that ends the thread while its library is being
/// loaded keeps the loader's lock, for which every thread may wait that should end the process. So it ends
/// some seconds later in any case.
class PluginThread {
public:
    PluginThread();
    ~PluginThread(); // NOLINT(performance-trivially-destructible): Windows has something to do there
    PluginThread(const PluginThread &) = delete;
    PluginThread &operator=(const PluginThread &) = delete;

    /// Delivers the messages of windows and COM objects that wait for the calling thread, which none of our
    /// own event loops does: otherwise those of one plug-in would be delivered while the next is probed.
    static void deliverMessages();

    /// Whether a plug-in ended the thread in a way that runs nothing of ours: Windows unwinds no stack for
    /// it.
    static bool hasEndedAlone(std::thread &thread);

private:
    bool m_prepared = false;
    unsigned m_timer = 0;     ///< the system's number of a timer that keeps its thread running
    void *m_leaves = nullptr; ///< the system's event that says that this object goes
};
