#pragma once

#include "Main/ReWire/ReWireSystem.h"

/// What the operations of this layer answer; the mixer interface's open function has results of its own.
namespace ReWireResult {
inline constexpr int kOk = 1;
inline constexpr int kAlreadyOpen = 6;
inline constexpr int kNotFound = 100;
inline constexpr int kUnusable = 101; ///< too old, too new, or lacking a function
inline constexpr int kSystemTooOld = 109;
} // namespace ReWireResult

struct ReWireVersion {
    qint16 major = 0;
    qint16 minor = 0;

    /// Whether the library can be used: only the 1.x line from 1.8 on is accepted, no later one.
    bool isAccepted() const { return major == 1 && minor >= 8; }
};

/// The handle of the installed ReWire library, which it frees when it goes. For one thread at a time.
class ReWireLibrary {
public:
    /// Without a system there is no library.
    explicit ReWireLibrary(ReWireSystem *system)
        : m_system(system)
    {}
    ~ReWireLibrary() { free(); }
    ReWireLibrary(const ReWireLibrary &) = delete;
    ReWireLibrary &operator=(const ReWireLibrary &) = delete;

    /// Loads it from its shared folder, a debug or beta version before the released one: `kOk`, `kNotFound`
    /// or `kSystemTooOld`. Not to be called while it is loaded.
    int load();
    void free();
    bool isLoaded() const { return m_handle != nullptr; }
    /// The version in the loaded file, 0.0 when it has none there; none when the file's path is unknown.
    std::optional<ReWireVersion> version() const;
    /// The address of an exported function of the loaded library, or null.
    void *function(const char *name) const { return m_system->function(m_handle, name); }

private:
    ReWireSystem *m_system;
    void *m_handle = nullptr;
};
