#include "Tests/Main/AudioEngineController/Effects/VST3/BrokenModules.h"

#include <elf.h>

#include <cstddef>

std::vector<BrokenModule> brokenModules(const QByteArray &healthy)
{
    QByteArray foreign = healthy;
    foreign[static_cast<int>(offsetof(Elf64_Ehdr, e_machine))] = static_cast<char>(EM_AARCH64);
    QByteArray old = foreign;
    old[EI_CLASS] = static_cast<char>(ELFCLASS32);
    old[static_cast<int>(offsetof(Elf64_Ehdr, e_machine))] = static_cast<char>(EM_386);
    QByteArray missingLibrary = healthy;
    missingLibrary.replace("libstdc++.so", "libstdc--.so");
    QByteArray missingSymbol = healthy;
    missingSymbol.replace("dladdr", "dlaxxr");
    return {
        {"empty file", "", false, {}, "file too short"},
        {"text file", QByteArray("this is no plug-in\n").repeated(100), false, {}, "invalid ELF header"},
        {"other machine", foreign, false, {}, "(the file is built for 64-bit ARM)"},
        {"32 bits", old, false, {}, "wrong ELF class: ELFCLASS32 (the file is built for 32-bit x86)"},
        {"missing library", missingLibrary, false, {}, "libstdc--.so"},
        {"missing symbol", missingSymbol, false, {}, "undefined symbol: dlaxxr"},
        {"empty bundle", {}, true, {}, "the bundle has no module in Contents/x86_64-linux"},
        {"ambiguous bundle",
         {},
         true,
         {"one.so", "two.so"},
         "the bundle has several modules and none of its own name"},
    };
}
