#include "Core/BaseLib/BinaryExports.h"
#include "Tests/Fuzz/FuzzTarget.h"

void fuzzElf(const QByteArray &input)
{
    // Without the zero that a QByteArray has behind its content.
    const std::vector<uchar> bytes(input.begin(), input.end());
    for (const QByteArray &name : {QByteArray("VSTPluginMain"), QByteArray("main")})
        if (findElfExports(ByteView(bytes.data(), bytes.size()), {name}) == ExportAnswer::Exported)
            require(input.contains(name + '\0'), "what is exported stands in the file");
}
