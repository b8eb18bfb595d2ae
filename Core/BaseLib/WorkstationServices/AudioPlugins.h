#pragma once

class PluginHost;

/// The process-wide registry of plug-in hosts, for code that does not own one. The base library only keeps
/// the pointer; the registry belongs to whoever stored it, who stores null before it goes.
namespace AudioPlugins {

void setRegistry(PluginHost *registry);
/// The stored registry. When none is stored, reports the assertion "0 != _this" and returns null.
PluginHost *registry();

} // namespace AudioPlugins
