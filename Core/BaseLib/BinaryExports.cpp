#include "Core/BaseLib/BinaryExports.h"

#include "Core/BaseLib/PagedFile.h"

ExportAnswer findExports(const QString &path, const std::vector<QByteArray> &names)
{
    PagedFile file(path);
    const ExportAnswer answer = findElfExports(file.content(), names);
    return answer != ExportAnswer::Unknown ? answer : findPeExports(file.content(), names);
}
