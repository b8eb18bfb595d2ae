#include "Core/BaseLib/Process/PluginThread.h"

PluginThread::PluginThread() = default;
PluginThread::~PluginThread() = default;
bool PluginThread::hasEndedAlone(std::thread &) { return false; }
void PluginThread::deliverMessages() {}
