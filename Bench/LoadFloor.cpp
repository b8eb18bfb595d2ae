// The least that a scan of these files can cost: each is loaded, asked and unloaded, and nothing else is
// done.

#include "Bench/LoadFloor.h"

#include <cstdio>
#include <cstring>
#include <fstream>
#include <string>

namespace {

/// The most memory that this process has held, in KiB. Not asked of getrusage, which counts what the process
/// that started this one held.
long peakMemory()
{
    std::ifstream status("/proc/self/status");
    long kibibytes = 0;
    for (std::string line; std::getline(status, line);)
        std::sscanf(line.c_str(), "VmHWM: %ld kB", &kibibytes); // NOLINT(cert-err34-c): the kernel's own form
    return kibibytes;
}

} // namespace

int main(int argc, char **argv)
{
    auto *load = loadVst3;
    int listed = 0;
    for (int index = 1; index < argc; ++index) {
        const bool isVst2 = std::strcmp(argv[index], "vst2") == 0;
        if (isVst2 || std::strcmp(argv[index], "vst3") == 0) { // the files from here on
            load = isVst2 ? loadVst2 : loadVst3;
            continue;
        }
        const int plugins = load(argv[index]);
        if (plugins < 0) {
            std::fprintf(stderr, "cannot load %s\n", argv[index]);
            return 1;
        }
        listed += plugins;
    }
    std::printf("%d plug-ins, %ld KiB\n", listed, peakMemory());
    return 0;
}
