#pragma once

#include <QString>
#include <QStringList>

/// What a process that dies tells of the fault that ends it.
struct CrashReport {
    QString summary;    ///< as "invalid memory access at 0x10 in Name.so+0x12A"; empty: it told nothing
    QStringList frames; ///< the calls that led there, the innermost first: "Name.so+0x12A"

    /// Has this process describe what ends it on the error output of this moment, whatever plug-ins do to
    /// that later. Handlers that they install come first. To be called on the thread that asks plug-ins.
    static void install();
    /// Tells which module, a file or a bundle, is being asked: where the fault comes up in another's code,
    /// the summary names the innermost frame of this one too.
    static void setPlugin(const QString &path);
    /// Takes the description out of what such a process printed.
    static CrashReport take(QString &printed);
};
