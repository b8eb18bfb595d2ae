#pragma once

#include <QByteArray>
#include <QString>

/// Puts a module as "NAME.clap" into a folder, with its script beside it: a null script gives no script file,
/// so that the module has one healthy plug-in named after the file. Returns the module's full path. The
/// statements are in Tests/Fixtures/README.md.
QString addCLAPFile(const QString &folder, const QString &name, const QByteArray &script = {},
                    bool isPlugin = true);
