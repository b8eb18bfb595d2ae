#pragma once

#include <QString>

/// What `--help` prints for a command line that is about `fxscan`'s options: not here, QCommandLineParser
/// makes it. These are the other texts that list the options, made from the same table when the program is
/// built.

/// Completion for bash.
QString bashCompletion();

/// A manual page: the template (troff), with its line "@OPTIONS@" replaced by an entry for each option, and
/// its lines "@SCANNER_ARGUMENTS@", "@SCANNER_VARIABLES@" and "@SCANNER_EXITS@" by those of the scanner's
/// usage.
QString manualPage(QString manualTemplate);
