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

/// Starts a process that stays until it is ended, and leaves its number in a file.
bool leaveChild(const std::string &file);
/// The same, as far from this process as the system allows.
bool leaveDaemon(const std::string &file);
/// Starts a process that stays and holds so many MiB.
bool feedChild(const std::string &mebibytes);
/// Has the system not end this process when its parent dies.
bool outliveParent();
/// Ends the process that started this one, with its group.
bool killParent();
/// Writes into every descriptor or handle that can be written to, but the standard ones.
bool writeEverywhere();
/// Closes every descriptor or handle that can be closed.
bool closeEverything();
/// Whether there is a terminal or console to write to.
bool hasTerminal();
void setFileMask(int mask);
/// Lets an alarm signal arrive after so many seconds, where the system has one; false for none.
bool startAlarm(const std::string &seconds);
