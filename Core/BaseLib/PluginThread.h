#pragma once

/// Makes the calling thread one that plug-ins can run on, for as long as the object lives: on Windows they
/// rely on a COM apartment of a single thread.
class PluginThread {
public:
    PluginThread();
    ~PluginThread();
    PluginThread(const PluginThread &) = delete;
    PluginThread &operator=(const PluginThread &) = delete;

    /// Delivers the messages of windows and COM objects that wait for the calling thread, which none of our
    /// own event loops does: left lying, those of one plug-in would be delivered by the next one.
    static void deliverMessages();

private:
    bool m_prepared = false;
};
