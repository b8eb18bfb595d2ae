#include "Core/BaseLib/Binary/win32/ImportSearch.h"

#include <QDir>
#include <QFileInfo>
#include <QRegularExpression>

#include <vector>

#include <windows.h>

namespace {

/// Whether Windows resolves the name by other means than a search for a file: by its table of API sets, or,
/// for the run-time libraries of the compilers of 2005 and 2008, by the library's manifest.
bool isResolvedElsewhere(const QString &name)
{
    static const QRegularExpression pattern(
        QStringLiteral(R"(^(api-ms-|ext-ms-|(msvc[rpm]|mfcm?|atl|vcomp)[89]0))"),
        QRegularExpression::CaseInsensitiveOption);
    return pattern.match(name).hasMatch();
}

/// The full path of the first such file on the search path; empty when there is none.
QString onSearchPath(const QString &name)
{
    std::vector<wchar_t> path(MAX_PATH);
    DWORD length = 0;
    while ((length = SearchPathW(nullptr, name.toStdWString().c_str(), L".dll",
                                 static_cast<DWORD>(path.size()), path.data(), nullptr)) > path.size())
        path.resize(length);
    return QString::fromWCharArray(path.data(), static_cast<int>(length));
}

bool belongsToTheSystem(const QString &path)
{
    wchar_t folder[MAX_PATH] = {};
    const UINT length = GetWindowsDirectoryW(folder, MAX_PATH);
    const QString prefix = QString::fromWCharArray(folder, static_cast<int>(length)) + QLatin1Char('\\');
    return length < MAX_PATH && path.startsWith(prefix, Qt::CaseInsensitive);
}

} // namespace

LibrarySearch importSearch(const QString &firstFolder)
{
    return [firstFolder](const QString &name, const QString &) -> std::optional<QString> {
        if (isResolvedElsewhere(name) || GetModuleHandleW(name.toStdWString().c_str()))
            return QString();
        const QString beside = firstFolder.isEmpty() ? QString() : QDir(firstFolder).filePath(name);
        if (!beside.isEmpty() && QFileInfo(beside).isFile())
            return beside;
        const QString found = onSearchPath(name);
        if (found.isEmpty())
            return std::nullopt;
        return belongsToTheSystem(found) ? QString() : found;
    };
}
