#include "Core/BaseLib/PluginThread.h"

PluginThread::PluginThread() = default;
PluginThread::~PluginThread() = default;
void PluginThread::deliverMessages() {}
