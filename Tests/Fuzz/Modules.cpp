#include "Core/BaseLib/Binary/BinaryExports.h"
#include "Core/BaseLib/Binary/LoadFailure.h"
#include "Core/BaseLib/Binary/PeImage.h"
#include "Tests/Fuzz/FuzzTarget.h"

namespace {

const QByteArray kNames[] = {"VSTPluginMain", "main"};

/// The input without the zero that a QByteArray has behind its content.
std::vector<uchar> bytesOf(const QByteArray &input) { return {input.begin(), input.end()}; }

void readTables(const PeImage &image, const QByteArray &input)
{
    for (const QByteArray &name : kNames)
        if (image.findExports({name}) == ExportAnswer::Exported)
            require(input.contains(name + '\0'), "what is exported stands in the file");
    for (const auto &libraries : {image.imports(), image.delayImports()})
        for (const QString &library : libraries.value_or(QStringList()))
            require(library.size() <= 260, "no library has a longer name than the system takes");
}

} // namespace

void fuzzPe(const QByteArray &input)
{
    const std::vector<uchar> bytes = bytesOf(input);
    if (const std::optional<PeImage> image = PeImage::read(ByteView(bytes.data(), bytes.size())))
        readTables(*image, input);

    const QString file = "library.dll";
    writeFuzzFile(file, input);
    // Of the libraries that it needs, some are missing, some load, and the others are this one again.
    const auto search = [&](const QString &name, const QString &) -> std::optional<QString> {
        if (name.startsWith('m'))
            return std::nullopt;
        return name.startsWith('k') ? QString() : file;
    };
    whyNotLoadable(file, search);
}
