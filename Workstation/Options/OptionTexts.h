#pragma once

#include <QString>

/// What `--help` prints for a command line that is about `fxscan`'s options: not here, QCommandLineParser
/// makes it. These are the other texts that list the options, made from the same table when the program is
/// built.

/// Completion for bash.
QString bashCompletion();

/// The manual page: the template (troff), with its line "@OPTIONS@" replaced by an entry for each option.
QString manualPage(QString manualTemplate);
