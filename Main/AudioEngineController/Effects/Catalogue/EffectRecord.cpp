#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"

#include <tuple>

namespace {

auto fieldsOf(const EffectRecord &record)
{
    return std::tie(record.path, record.fileTime, record.name, record.id, record.vendor, record.categories,
                    record.inputs, record.outputs, record.enabled, record.category, record.working,
                    record.favourite, record.vstCategory, record.behaviour, record.width, record.latency,
                    record.subName, record.subId, record.version);
}

} // namespace

bool operator==(const EffectRecord &left, const EffectRecord &right)
{
    return fieldsOf(left) == fieldsOf(right);
}

QString fileNameOf(const QString &path) { return path.mid(path.lastIndexOf(QLatin1Char('/')) + 1); }

bool EffectRecord::standsForFile() const
{
    if (working || subId != 0)
        return false;
    EffectRecord file;
    file.path = path;
    NameFromPath(file);
    return (id == file.name && !hasFreeId) || id.startsWith(path);
}

void takeMarks(EffectRecord &record, const EffectRecord &old)
{
    record.favourite = old.favourite;
    // A file that failed at first has no category of its own to hand on.
    if (old.working || old.category != 0)
        record.category = old.category;
    if (!old.isSwitchedOff())
        return;
    record.enabled = false;
    record.working = true;
}

bool settleIgnored(EffectRecord &record, bool isIgnored)
{
    if (isIgnored == record.isIgnored() || (isIgnored && !record.enabled))
        return false;
    record.enabled = !isIgnored;
    record.working = false;
    record.fileTime = isIgnored ? QString::fromLatin1(kIgnoredTime) : QString();
    return true;
}

bool NameFromPath(EffectRecord &record)
{
    const int dot = record.path.lastIndexOf(QLatin1Char('.'));
    if (dot < 0)
        return false;
    const int start = record.path.lastIndexOf(QLatin1Char('/')) + 1;
    // A "." in a folder's name is not the start of the file's ending.
    QString name = dot < start ? record.path.mid(start) : record.path.mid(start, dot - start);
    for (const QLatin1String mark : {QLatin1String("x64"), QLatin1String("_64"), QLatin1String(" 64bit")}) {
        const int at = name.indexOf(mark);
        if (at >= 0)
            name.remove(at, mark.size());
    }
    record.name = name;
    return true;
}
