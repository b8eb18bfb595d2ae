#include "Core/BaseLib/Binary/BinaryExports.h"

#include "Core/BaseLib/Binary/PagedFile.h"
#include "Core/BaseLib/Binary/posix/ElfTables.h"

ExportAnswer findExports(const QString &path, const std::vector<QByteArray> &names)
{
    PagedFile file(path);
    const ExportAnswer answer = findElfExports(file.content(), names);
    return answer != ExportAnswer::Unknown ? answer : findPeExports(file.content(), names);
}
