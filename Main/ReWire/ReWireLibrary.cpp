#include "Main/ReWire/ReWireLibrary.h"

#include <cstring>

namespace {

constexpr const char *kFileNames[] = {"ReWireDebug.dll", "ReWireBeta.dll", "ReWire.dll"};
constexpr char kFolderBelowCommonFiles[] = "\\Propellerhead Software\\ReWire\\";
/// MAX_PATH of Windows.
constexpr size_t kPathBuffer = 260;

/// None when the system knows no such folder, or the path is too long. One character of the buffer stays
/// unused beside the terminating zero, as it always has.
std::optional<std::string> pathOf(ReWireSystem &system, const char *name)
{
    std::optional<std::string> path = system.commonFilesFolder();
    if (!path)
        return std::nullopt;
    path->append(kFolderBelowCommonFiles);
    if (path->size() + 1 + std::strlen(name) >= kPathBuffer)
        return std::nullopt;
    path->append(name);
    return path;
}

} // namespace

int ReWireLibrary::load()
{
    if (!m_system || !m_system->isRecentEnough())
        return ReWireResult::kSystemTooOld;
    for (const char *name : kFileNames) {
        const std::optional<std::string> path = pathOf(*m_system, name);
        m_handle = path ? m_system->load(*path) : nullptr;
        if (m_handle)
            return ReWireResult::kOk;
    }
    return ReWireResult::kNotFound;
}

void ReWireLibrary::free()
{
    if (m_handle)
        m_system->free(m_handle);
    m_handle = nullptr;
}

std::optional<ReWireVersion> ReWireLibrary::version() const
{
    const std::optional<std::string> path = m_system->pathOf(m_handle);
    if (!path)
        return std::nullopt;
    const quint32 version = m_system->fileVersion(*path).value_or(0);
    return ReWireVersion{static_cast<qint16>(version >> 16), static_cast<qint16>(version & 0xffff)};
}
