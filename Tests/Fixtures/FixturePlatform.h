#pragma once

#include <string>

// What the scripted plug-ins need of the operating system. All paths are UTF-8.

/// The full path of the module that this function is linked into.
std::string modulePath();

/// Reads a whole file; false when it cannot be opened.
bool readFile(const std::string &path, std::string &content);
/// Appends to a file in one write, so that the lines of several processes do not mix; false when it fails.
bool appendToFile(const std::string &path, const std::string &text);

void sleepMilliseconds(int milliseconds);
/// Ends the process at once, without exit handlers.
[[noreturn]] void endProcess(int exitCode);
/// Ends the process from outside, as a user would who lost patience.
void killProcess();
/// Ends the calling thread only.
void endThread();

// Side effects that real plug-ins leave behind. Each answers false for a value it does not know, and does
// nothing where the system has no such thing.

/// Sets the mask of file permissions, given in octal.
bool changeFileMask(const std::string &octal);
bool changeWorkingFolder(const std::string &path);
/// Installs a handler that does nothing, for "segv", "fpe", "ill", "abrt", "term", "int" or "alrm".
bool installSignalHandler(const std::string &signalName);
/// Touches memory that is not there and repairs that in a handler of its own, as copy protection does. "keep"
/// leaves a handler behind, which ends the process at any other violation; "restore" puts the one before
/// back.
bool repairOwnViolation(const std::string &afterwards);
/// Lets an alarm signal arrive after so many seconds.
bool startAlarm(const std::string &seconds);
