#include "Core/BaseLib/Binary/LoadFailure.h"

#include "Core/BaseLib/Binary/PagedFile.h"
#include "Core/BaseLib/Binary/PeImage.h"
#include "Core/BaseLib/Log/FormatText.h"

#include <QSet>

namespace {

/// More libraries than any honest plug-in brings along.
constexpr int kMostLibraries = 200;

/// What a machine type means for people.
QString machineName(quint16 machine)
{
    switch (machine) {
    case kPeMachineX86:
        return QStringLiteral("32-bit x86");
    case kPeMachineArm:
        return QStringLiteral("32-bit ARM");
    case kPeMachineArm64:
        return QStringLiteral("64-bit ARM");
    case kPeMachineItanium:
        return QStringLiteral("Itanium");
    default:
        return formatText(L"another machine (type 0x%04X)", static_cast<unsigned>(machine));
    }
}

/// Goes through a library and those that it needs, each once.
class Diagnosis {
public:
    explicit Diagnosis(const LibrarySearch &search)
        : m_search(search)
    {}

    QString of(const QString &path)
    {
        PagedFile file(path);
        if (file.content().isEmpty())
            return {}; // the loader's message says enough
        const std::optional<PeImage> image = PeImage::read(file.content());
        if (!image)
            return QStringLiteral("is not a Windows library");
        if (image->machine() != kPeMachineX86_64)
            return QStringLiteral("is built for ") + machineName(image->machine());
        if (!image->isComplete())
            return QStringLiteral("is cut short or damaged");
        return ofImports(image->imports().value_or(QStringList()));
    }

private:
    QString ofImports(const QStringList &names)
    {
        for (const QString &name : names) {
            const QString reason = ofImport(name);
            if (!reason.isEmpty())
                return QStringLiteral("needs ") + name + QStringLiteral(", which ") + reason;
        }
        return {};
    }

    QString ofImport(const QString &name)
    {
        if (m_seen.size() >= kMostLibraries || m_seen.contains(name.toLower()))
            return {};
        m_seen.insert(name.toLower());
        const std::optional<QString> path = m_search(name);
        if (!path)
            return QStringLiteral("is not found");
        return path->isEmpty() ? QString() : of(*path);
    }

    const LibrarySearch &m_search;
    QSet<QString> m_seen;
};

} // namespace

QString whyNotLoadable(const QString &path, const LibrarySearch &search)
{
    return Diagnosis(search).of(path);
}
