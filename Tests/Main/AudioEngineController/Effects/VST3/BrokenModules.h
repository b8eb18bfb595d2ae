#pragma once

#include <QByteArray>
#include <QStringList>

#include <vector>

/// A plug-in that the system cannot load, and what the log says about it.
struct BrokenModule {
    QString name;
    QByteArray content; ///< of the file
    bool isBundle;      ///< a bundle folder with copies of the healthy module in place of a file
    QStringList binaries;
    QString reason;
};

/// Those of this system, made from a healthy module.
std::vector<BrokenModule> brokenModules(const QByteArray &healthy);
