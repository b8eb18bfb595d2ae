#pragma once

#include <QtGlobal>

#include <memory>
#include <optional>
#include <string>

/// What is asked of the operating system about the installed ReWire library. Paths are in its 8-bit encoding.
class ReWireSystem {
public:
    virtual ~ReWireSystem() = default;

    /// Whether the system is one that ReWire runs on: Windows 5.1 without a service pack, or later.
    virtual bool isRecentEnough() = 0;
    /// The folder of files that programs share ("Common Files"), without a backslash at its end.
    virtual std::optional<std::string> commonFilesFolder() = 0;
    /// Loads a library without letting the system show a box; null on failure.
    virtual void *load(const std::string &path) = 0;
    /// The address of an exported function, or null.
    virtual void *function(void *library, const char *name) = 0;
    virtual void free(void *library) = 0;
    /// Where a loaded library was loaded from; none when it is unknown or longer than 255 characters.
    virtual std::optional<std::string> pathOf(void *library) = 0;
    /// The upper half of the version number in a file's version resource: 16 bits each of major and minor
    /// version. None when there is no such resource.
    virtual std::optional<quint32> fileVersion(const std::string &path) = 0;
};

/// The system that this runs on; null where ReWire was never published.
std::unique_ptr<ReWireSystem> installedReWireSystem();
