#pragma once

/// Prints the help or the version when that is what the first argument asks for; touches no file, display or
/// lock. False, and nothing is printed, for any other argument.
bool printHelp(const char *argument);
