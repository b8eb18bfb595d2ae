#include "Tests/Fuzz/FuzzTarget.h"

#include <cstdio>
#include <cstdlib>
#include <string>

// What libFuzzer calls. The option --target=NAME says which target it drives; libFuzzer itself passes over
// options of that form.

namespace {
const FuzzTarget *s_target = nullptr;
}

extern "C" int LLVMFuzzerInitialize(int *argc, char ***argv)
{
    constexpr char kOption[] = "--target=";
    for (int index = 1; index < *argc; ++index)
        for (const FuzzTarget &target : kFuzzTargets)
            if ((*argv)[index] == std::string(kOption) + target.name)
                s_target = &target;
    if (s_target)
        return 0;
    std::fprintf(stderr, "No target, or none of that name: %sNAME\n", kOption);
    std::exit(2);
}

extern "C" int LLVMFuzzerTestOneInput(const unsigned char *data, std::size_t size)
{
    static const FuzzFolder folder;
    s_target->run(QByteArray(reinterpret_cast<const char *>(data), static_cast<int>(size)));
    return 0;
}
