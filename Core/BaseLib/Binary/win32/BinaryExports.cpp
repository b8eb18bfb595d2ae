#include "Core/BaseLib/Binary/BinaryExports.h"

#include "Core/BaseLib/Binary/ModuleFile.h"
#include "Core/BaseLib/Binary/PagedFile.h"
#include "Core/BaseLib/Binary/PeImage.h"

const LibraryForm kOwnForm = LibraryForm::Pe;

std::optional<QStringList> neededLibraries(ByteView file)
{
    const std::optional<PeImage> image = PeImage::read(file);
    return image ? image->imports() : std::nullopt;
}

ExportAnswer findExports(const QString &path, const std::vector<QByteArray> &names)
{
    PagedFile file(path);
    return findExports(file.content(), names);
}

ExportAnswer findExports(ByteView file, const std::vector<QByteArray> &names)
{
    return findPeExports(file, names);
}
