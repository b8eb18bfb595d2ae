#include "Main/ReWire/ReWireProbe.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Main/ReWire/ReWireLibrary.h"

#include <cstdarg>
#include <cstdio>
#include <exception>

namespace {

constexpr int kVersionOk = 0;
constexpr int kUpdateRequired = 1;

int examine(ReWireSystem *system)
{
    ReWireLibrary library(system); // its own handle: an open mixer interface keeps the one that it has
    if (library.load() != ReWireResult::kOk)
        return kUpdateRequired;
    const std::optional<ReWireVersion> version = library.version();
    if (!version)
        return kUpdateRequired;
    printReWire("REWIRE LIBRARY VERSION: %d.%d\n", version->major, version->minor);
    return version->isAccepted() ? kVersionOk : kUpdateRequired;
}

} // namespace

int probeReWireVersion() noexcept
{
    try {
        return probeReWireVersion(installedReWireSystem().get());
    } catch (const std::exception &) {
        return kUpdateRequired;
    }
}

int probeReWireVersion(ReWireSystem *system) noexcept
{
    try {
        return examine(system);
    } catch (const std::exception &exception) {
        DebugLog(L"The ReWire library could not be examined: %s", exception.what());
        return kUpdateRequired;
    }
}

void printReWire(const char *format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    std::vprintf(format, arguments);
    va_end(arguments);
}
