#include "Core/BaseLib/Binary/ModuleFile.h"
#include "Core/BaseLib/Binary/posix/ElfTables.h"
#include "Tests/Fuzz/FuzzTarget.h"

void fuzzElf(const QByteArray &input)
{
    // Without the zero that a QByteArray has behind its content.
    const std::vector<uchar> bytes(input.begin(), input.end());
    const ByteView view(bytes.data(), bytes.size());
    readElfNeeds(view);
    inspectContent(view);
    const QString file = "module.so";
    writeFuzzFile(file, input);
    for (const QByteArray name : {"VSTPluginMain", "main"}) {
        const ExportAnswer answer = findElfExports(view, {name});
        if (answer == ExportAnswer::Exported)
            require(input.contains(name + '\0'), "what is exported stands in the file");
        if (answer != ExportAnswer::Unknown)
            require(findExports(file, {name}) == answer, "a file read by its pages says the same");
    }
}
