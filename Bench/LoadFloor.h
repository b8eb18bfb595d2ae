#pragma once

/// Loads a module, makes the calls into it that a scan makes, and unloads it; nothing is checked, and a
/// plug-in that misbehaves takes the process along. Gives the number of plug-ins in it, -1 when it could not
/// be loaded.
int loadVst2(const char *path);
int loadVst3(const char *path);
