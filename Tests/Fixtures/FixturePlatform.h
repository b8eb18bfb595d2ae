#pragma once

#include <string>

// What the scripted plug-ins need of the operating system. All paths are UTF-8.

/// The full path of the module that this function is linked into.
std::string modulePath();

/// Appends to a file in one write, so that the lines of several processes do not mix; false when it fails.
bool appendToFile(const std::string &path, const std::string &text);

/// Ends the process at once, without exit handlers.
[[noreturn]] void endProcess(int exitCode);
/// Ends the process from outside, as a user would who lost patience.
void killProcess();
/// Ends the calling thread only.
void endThread();

/// What only some systems have plug-ins do; false elsewhere, and for no such kind.
bool causePlatformEffect(const std::string &kind, const std::string &value);
void setFileMask(int mask);
/// Lets an alarm signal arrive after so many seconds, where the system has one; false for none.
bool startAlarm(const std::string &seconds);
