#include "Core/BaseLib/Binary/LoadFailure.h"

#include "Core/BaseLib/Binary/ModuleFile.h"
#include "Core/BaseLib/Binary/PagedFile.h"
#include "Core/BaseLib/Files/NativeFile.h"

#include <QSet>

namespace {

/// More libraries than any honest plug-in brings along.
constexpr int kMostLibraries = 200;

/// "a", "a and b", "a, b and c".
QString inWords(const QStringList &names)
{
    return names.size() < 2 ? names.join(QString())
                            : names.mid(0, names.size() - 1).join(QLatin1String(", ")) +
                                  QLatin1String(" and ") + names.last();
}

/// Goes through a library and those that it needs, each once.
class Diagnosis {
public:
    explicit Diagnosis(const LibrarySearch &search)
        : m_search(search)
    {}

    QString of(const QString &path)
    {
        lookAt(path);
        if (!m_missing.isEmpty())
            return QStringLiteral("%1%2, which %3 not installed")
                .arg(QLatin1String(kNeedsLibrary), inWords(m_missing),
                     m_missing.size() == 1 ? QStringLiteral("is") : QStringLiteral("are"));
        return m_unusable;
    }

    QString ofCut(const QString &path)
    {
        lookAt(path);
        return m_cutShort;
    }

private:
    /// In the loader's order: a library's own needs come after those of whatever needs it. A name that was
    /// found once serves all.
    void lookAt(const QString &path)
    {
        m_queue = QStringList(path);
        while (!m_queue.isEmpty()) {
            const QString library = m_queue.takeFirst();
            PagedFile file(library);
            for (const QString &name : neededLibraries(file.content()).value_or(QStringList()))
                lookFor(name, library);
        }
    }

    void lookFor(const QString &name, const QString &neededBy)
    {
        if (m_seen.size() >= kMostLibraries || m_seen.contains(pathKey(name)))
            return;
        m_seen.insert(pathKey(name));
        const std::optional<QString> path = m_search(name, neededBy);
        if (!path)
            m_missing.append(name);
        else if (!path->isEmpty())
            lookInto(name, *path);
    }

    void lookInto(const QString &name, const QString &path)
    {
        const ModuleInspection library = inspectModule(path);
        if (library.isLoadable()) {
            m_queue.append(path);
            return;
        }
        const QString which = library.reason.mid(library.reason.indexOf(QLatin1Char(' '))); // instead of "it"
        const QString reason = QStringLiteral("%1%2, which%3").arg(QLatin1String(kNeedsLibrary), name, which);
        if (m_unusable.isEmpty())
            m_unusable = reason;
        if (m_cutShort.isEmpty() && library.verdict == ModuleInspection::Verdict::CutShort)
            m_cutShort = reason;
    }

    const LibrarySearch &m_search;
    QStringList m_queue; ///< paths to look at
    QSet<QString> m_seen;
    QStringList m_missing;
    QString m_unusable; ///< the first library that is there in vain
    QString m_cutShort; ///< the first one that is cut short
};

} // namespace

QString whyNotLoadable(const QString &path, const LibrarySearch &search)
{
    return Diagnosis(search).of(path);
}

QString whyCutShort(const QString &path, const LibrarySearch &search)
{
    return Diagnosis(search).ofCut(path);
}
