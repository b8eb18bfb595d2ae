#pragma once

#include <QString>

#include <cstdio>
#include <optional>

/// What the system knows of the streams that `Terminal` prints to.
namespace TerminalStream {

bool isTerminal(std::FILE *stream);
/// Columns of the terminal; 0 where there is none, or nobody knows.
int width(std::FILE *stream);
/// Writes to a console that takes texts, not bytes: whether it went well; nothing for any other stream.
std::optional<bool> writeAsText(std::FILE *stream, const QString &text);
/// A stream to where the standard output went so far; what is printed there goes to the error output from now
/// on. Null, and nothing is changed, when the system refuses.
std::FILE *takeOutput();

} // namespace TerminalStream
