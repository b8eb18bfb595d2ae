#pragma once

#include <QString>

/// A text of others, fit to be shown in a line: what could begin another line, steer a terminal, or change
/// the direction in which the rest of the line is shown is replaced by "?".
QString harmlessText(const QString &text);
