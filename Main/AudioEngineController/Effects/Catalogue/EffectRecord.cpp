#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"

QString fileNameOf(const QString &path) { return path.mid(path.lastIndexOf(QLatin1Char('/')) + 1); }

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

bool NameFromPath(EffectRecord &record)
{
    const int dot = record.path.lastIndexOf(QLatin1Char('.'));
    if (dot < 0)
        return false;
    const int start = record.path.lastIndexOf(QLatin1Char('/')) + 1;
    // A "." in a folder's name is no ending of the file's.
    QString name = dot < start ? record.path.mid(start) : record.path.mid(start, dot - start);
    for (const QLatin1String mark : {QLatin1String("x64"), QLatin1String("_64"), QLatin1String(" 64bit")}) {
        const int at = name.indexOf(mark);
        if (at >= 0)
            name.remove(at, mark.size());
    }
    record.name = name;
    return true;
}
