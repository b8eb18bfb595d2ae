#include "Core/BaseLib/BinaryExports.h"

#include "Core/BaseLib/MappedFile.h"

ExportAnswer findExports(const QString &path, const std::vector<QByteArray> &names)
{
    const MappedFile file(path);
    const ExportAnswer answer = findElfExports(file.content(), names);
    return answer != ExportAnswer::Unknown ? answer : findPeExports(file.content(), names);
}
