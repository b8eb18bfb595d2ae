#pragma once

#include <QByteArray>
#include <QString>
#include <QStringList>

#include <ostream>

// What a failed comparison shows; without these, GoogleTest prints Qt's texts as lists of numbers.

inline void PrintTo(const QString &text, std::ostream *out) { *out << '"' << text.toStdString() << '"'; }

inline void PrintTo(const QByteArray &text, std::ostream *out) { *out << '"' << text.toStdString() << '"'; }

inline void PrintTo(const QStringList &texts, std::ostream *out)
{
    *out << "[";
    for (const QString &text : texts)
        *out << "\n  \"" << text.toStdString() << '"';
    *out << "]";
}
