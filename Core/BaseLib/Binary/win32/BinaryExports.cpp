#include "Core/BaseLib/Binary/BinaryExports.h"

#include "Core/BaseLib/Binary/PagedFile.h"

ExportAnswer findExports(const QString &path, const std::vector<QByteArray> &names)
{
    PagedFile file(path);
    return findPeExports(file.content(), names);
}
