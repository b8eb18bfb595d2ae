#include "Main/AudioEngineController/Effects/VST/VSTHost.h"
#include "Main/ReWire/ReWireLibrary.h"
#include "Tests/Fuzz/FuzzTarget.h"

#include <QtEndian>

#include <cmath>

namespace {

/// A system where only the last of the names loads, with a version resource as the input has it.
class FuzzedSystem : public ReWireSystem {
public:
    explicit FuzzedSystem(const QByteArray &input)
        : m_folder(input.mid(4).toStdString())
    {
        if (input.size() >= 4)
            m_version = qFromLittleEndian<quint32>(input.constData());
    }

    bool isRecentEnough() override { return true; }
    std::optional<std::string> commonFilesFolder() override { return m_folder; }
    void *load(const std::string &path) override
    {
        require(path.size() + 1 < 260, "no path is longer than the system takes");
        return path.find("\\ReWire.dll") != std::string::npos ? this : nullptr;
    }
    void *function(void *, const char *) override { return nullptr; }
    void free(void *) override {}
    std::optional<std::string> pathOf(void *) override { return m_folder; }
    std::optional<quint32> fileVersion(const std::string &) override { return m_version; }

private:
    std::string m_folder;
    std::optional<quint32> m_version;
};

} // namespace

void fuzzVersion(const QByteArray &input)
{
    FuzzedSystem system(input);
    ReWireLibrary library(&system);
    if (library.load() == ReWireResult::kOk) {
        const quint32 number = system.fileVersion({}).value_or(0);
        const bool isAccepted = number >= 0x10008 && number <= 0x17fff; // 1.8 to 1.32767
        require(library.version().value().isAccepted() == isAccepted, "the 1.x line from 1.8 on is accepted");
    }
    require(std::isfinite(waveShellVersion(QString::fromUtf8(input))), "a shell's version is a number");
}
