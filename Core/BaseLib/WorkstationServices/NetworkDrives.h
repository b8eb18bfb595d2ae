#pragma once

#include <QString>
#include <QStringList>

#include <optional>

/// The drive letters of the machine and what they are connected to.
class NetworkDrives {
public:
    struct List {
        bool isKnown = false; ///< the system gave its list
        int error = 0;        ///< the system's error code where it did not
        QStringList devices;  ///< each drive as letter and colon, in the system's order
    };

    virtual ~NetworkDrives() = default;

    virtual List list() = 0;
    /// The network path that a drive is connected to; none for local drives.
    virtual std::optional<QString> remoteName(const QString &device) = 0;
    /// Whether there is a file or a folder at the path.
    virtual bool exists(const QString &path) = 0;

    /// Those of this machine; none where drives have no letters.
    static NetworkDrives &system();
};
