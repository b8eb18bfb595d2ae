#include "Core/BaseLib/PluginThread.h"

PluginThread::PluginThread() = default;
PluginThread::~PluginThread() = default;
bool PluginThread::hasEndedAlone(std::thread &) { return false; }
void PluginThread::deliverMessages() {}
