#include "Tests/Main/AudioEngineController/Effects/VST3/BrokenModules.h"

#include <QtEndian>

#include <windows.h>

namespace {

/// The place of a field of the header in a library.
template <typename Field>
int headerOffset(const QByteArray &library, Field IMAGE_FILE_HEADER::*field)
{
    const int newHeader = static_cast<int>(
        qFromLittleEndian<quint32>(library.constData() + offsetof(IMAGE_DOS_HEADER, e_lfanew)));
    static const IMAGE_NT_HEADERS64 headers = {};
    return newHeader + static_cast<int>(reinterpret_cast<const char *>(&(headers.FileHeader.*field)) -
                                        reinterpret_cast<const char *>(&headers));
}

} // namespace

std::vector<BrokenModule> brokenModules(const QByteArray &healthy)
{
    QByteArray foreign = healthy;
    qToLittleEndian<quint16>(IMAGE_FILE_MACHINE_ARM64,
                             foreign.data() + headerOffset(healthy, &IMAGE_FILE_HEADER::Machine));
    QByteArray missingLibrary = healthy;
    missingLibrary.replace("KERNEL32.dll", "KERNEL00.dll");
    return {
        {"empty file", "", false, {}, "empty file.vst3: "},
        {"text file",
         QByteArray("this is no plug-in\n").repeated(100),
         false,
         {},
         "is not a Windows library"},
        {"other machine", foreign, false, {}, "is built for 64-bit ARM"},
        {"missing library", missingLibrary, false, {}, "needs KERNEL00.dll, which is not found"},
        {"empty bundle", {}, true, {}, "the bundle has no module in Contents/x86_64-win"},
    };
}
