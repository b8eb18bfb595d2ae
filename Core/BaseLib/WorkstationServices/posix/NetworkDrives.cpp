#include "Core/BaseLib/WorkstationServices/NetworkDrives.h"

namespace {

/// POSIX systems mount shares into their one tree of folders.
class NoDrives : public NetworkDrives {
public:
    List list() override { return {true, 0, {}}; }
    std::optional<QString> remoteName(const QString &) override { return std::nullopt; }
    bool exists(const QString &) override { return false; }
};

} // namespace

NetworkDrives &NetworkDrives::system()
{
    static NoDrives drives;
    return drives;
}
