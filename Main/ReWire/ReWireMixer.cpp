#include "Main/ReWire/ReWireMixer.h"

namespace {

constexpr const char *kEntryNames[] = {
    "RWM2OpenImp",
    "RWM2IsCloseOKImp",
    "RWM2CloseImp",
    "RWM2GetDeviceCountImp",
    "RWM2GetDeviceInfoImp",
    "RWM2GetDeviceInfoByHandleImp",
    "RWM2OpenDeviceImp",
    "RWM2IsCloseDeviceOKImp",
    "RWM2CloseDeviceImp",
    "RWM2DriveAudioImp",
    "RWM2IdleImp",
    "RWM2LaunchPanelAppImp",
    "RWM2IsPanelAppLaunchedImp",
    "RWM2QuitPanelAppImp",
    "RWM2GetEventInfoImp",
    "RWM2GetEventBusInfoImp",
    "RWM2GetEventChannelInfoImp",
    "RWM2GetControllerInfoImp",
    "RWM2GetNoteInfoImp",
    "RWM2SetAudioInfoImp",
};
static_assert(std::size(kEntryNames) == kReWireEntryCount);

using OpenFunction = int (*)(int interfaceVersion, void *argument);
/// The version of the mixer interface that its open function is asked for.
constexpr int kInterfaceVersion = 3000000;

} // namespace

ReWireMixer &ReWireMixer::instance()
{
    static const std::unique_ptr<ReWireSystem> system = installedReWireSystem();
    static ReWireMixer mixer(system.get());
    return mixer;
}

int ReWireMixer::addLoad()
{
    if (m_library.isLoaded()) {
        ++m_loadCount;
        return ReWireResult::kOk;
    }
    const int result = m_library.load();
    if (result != ReWireResult::kOk)
        return result;
    if (!m_library.version().value_or(ReWireVersion()).isAccepted()) {
        m_library.free();
        return ReWireResult::kUnusable;
    }
    m_loadCount = 1;
    return ReWireResult::kOk;
}

void ReWireMixer::dropLoad()
{
    if (m_loadCount > 0 && --m_loadCount == 0)
        m_library.free();
}

int ReWireMixer::open(void *argument)
{
    if (entry(ReWireEntry::Open))
        return ReWireResult::kAlreadyOpen;
    int result = addLoad();
    if (result != ReWireResult::kOk)
        return result;
    lookUpEntries();
    result = isUsable()
                 ? reinterpret_cast<OpenFunction>(entry(ReWireEntry::Open))(kInterfaceVersion, argument)
                 : ReWireResult::kUnusable;
    if (result != ReWireResult::kOk) {
        m_entries.fill(nullptr);
        dropLoad();
    }
    return result;
}

void ReWireMixer::lookUpEntries()
{
    for (size_t index = 0; index < kReWireEntryCount; ++index)
        m_entries[index] = m_library.function(kEntryNames[index]);
}

/// Older libraries lack the idle function and are accepted.
bool ReWireMixer::isUsable() const
{
    for (size_t index = 0; index < kReWireEntryCount; ++index) {
        if (!m_entries[index] && index != static_cast<size_t>(ReWireEntry::Idle))
            return false;
    }
    return true;
}
