#pragma once

#include "Main/ReWire/ReWireLibrary.h"

#include <array>

/// The mixer interface of the ReWire library: its functions, in the order in which they are looked up.
enum class ReWireEntry {
    Open,
    IsCloseOK,
    Close,
    GetDeviceCount,
    GetDeviceInfo,
    GetDeviceInfoByHandle,
    OpenDevice,
    IsCloseDeviceOK,
    CloseDevice,
    DriveAudio,
    Idle,
    LaunchPanelApp,
    IsPanelAppLaunched,
    QuitPanelApp,
    GetEventInfo,
    GetEventBusInfo,
    GetEventChannelInfo,
    GetControllerInfo,
    GetNoteInfo,
    SetAudioInfo,
};
inline constexpr size_t kReWireEntryCount = 20;

/// Loads the library for the mixer interface, counts who needs it, and holds the table of its functions. For
/// one thread at a time.
class ReWireMixer {
public:
    explicit ReWireMixer(ReWireSystem *system)
        : m_library(system)
    {}

    /// The one of the process. The scan does not open it.
    static ReWireMixer &instance();

    /// Loads the library, or counts one more user of it: `kOk`, `kUnusable` for a version that is not
    /// accepted, or what `ReWireLibrary::load` says.
    int addLoad();
    /// Takes a user back; the last one frees the library.
    void dropLoad();
    int loadCount() const { return m_loadCount; }

    /// Opens the interface for a caller, whose argument is handed on. What the library's open function
    /// answered (`kOk` is success), or `kAlreadyOpen`, `kUnusable` when it lacks a function, or what
    /// `addLoad` says. After all but `kOk` and `kAlreadyOpen` the table is empty and this user taken back.
    int open(void *argument);

    /// The address of a function of the open interface, else null. The idle function may be missing.
    void *entry(ReWireEntry entry) const { return m_entries[static_cast<size_t>(entry)]; }

private:
    void lookUpEntries();
    bool isUsable() const;

    ReWireLibrary m_library;
    int m_loadCount = 0;
    std::array<void *, kReWireEntryCount> m_entries = {};
};
