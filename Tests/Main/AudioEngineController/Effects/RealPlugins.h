#pragma once

#include <QStringList>

/// Which of Debian's plug-ins are there to scan: all that its packages hold, or, built for another system,
/// those of this list (of names between commas; empty means all).
inline bool isRealPluginHere(const QString &name)
{
    const QString list = QStringLiteral(FXPROBE_REAL_PLUGINS);
    return list.isEmpty() || list.split(QLatin1Char(',')).contains(name);
}

/// The rows "name|…" of a table whose plug-ins are there, sorted.
template <std::size_t count>
QStringList rowsOfRealPlugins(const char *const (&table)[count])
{
    QStringList rows;
    for (const char *row : table)
        if (isRealPluginHere(QString::fromUtf8(row).section(QLatin1Char('|'), 0, 0)))
            rows.append(QString::fromUtf8(row));
    rows.sort();
    return rows;
}
