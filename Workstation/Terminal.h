#pragma once

#include <QString>

/// What fxscan prints to, and how.
namespace Terminal {

/// Prints to standard output, or the error output, as UTF-8 (to a Windows console as UTF-16).
void print(const QString &text);
void printError(const QString &text);
/// True when the error output is a terminal that understands the usual control sequences.
bool errorIsTerminal();
/// Columns of the error output's terminal; 80 where nobody knows.
int errorWidth();

/// A text that comes from a plug-in or a file, fit to be printed: what could steer a terminal, or change the
/// direction in which the rest of the line is shown, is replaced.
QString harmless(const QString &text);
/// Columns that a text takes on a terminal.
int width(const QString &text);
/// The text in exactly so many columns: filled up, or cut with "…" at its end.
QString cell(const QString &text, int columns);

} // namespace Terminal
