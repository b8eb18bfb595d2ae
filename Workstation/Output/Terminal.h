#pragma once

#include <QString>

/// What fxscan prints to, and how.
namespace Terminal {

/// Prints to standard output, or the error output, as UTF-8 (to a Windows console as UTF-16). False when it
/// could not be written.
bool print(const QString &text);
bool printError(const QString &text);
/// Says on the error output what is wrong, after the program's name.
void complain(const QString &text);
/// The same as `print` for data whose texts come from plug-ins: on a terminal they must not steer it.
bool printData(const QString &text);
/// True when the error output is a terminal that understands the usual control sequences.
bool errorIsTerminal();
/// True when the standard output is a terminal.
bool outputIsTerminal();
/// From now on what is printed to standard output by anybody else goes to the error output: plug-ins print
/// where they like, and the result must stay readable.
void keepOutputForResult();
/// Columns of the error output's terminal; 80 where nobody knows.
int errorWidth();
/// Columns of the standard output's terminal; 0 where there is none, so that lines may have any length.
int outputWidth();

/// A text that comes from a plug-in or a file, fit to be printed: see `harmlessText`.
QString harmless(const QString &text);
/// Columns that a text takes on a terminal.
int width(const QString &text);
/// The text in exactly so many columns: filled up, or cut with "…" at its end.
QString cell(const QString &text, int columns);

} // namespace Terminal
