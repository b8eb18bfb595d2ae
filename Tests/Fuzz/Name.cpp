#include "Main/AudioEngineController/Effects/Catalogue/VSTCatalogue.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"
#include "Tests/Fuzz/FuzzTarget.h"

void fuzzName(const QByteArray &input)
{
    EffectRecord record;
    record.path = QString::fromUtf8(input);
    record.name = "as before";
    const QString fileName = fileNameOf(record.path);
    const bool named = NameFromPath(record);
    require(named == record.path.contains('.'), "a path with a point gives a name");
    require(named ? record.name.size() <= fileName.size() && !record.name.contains('/')
                  : record.name == "as before",
            "the name is a part of the file's name, or stays");

    const MarkerFormat &format = vstCatalogueFormat().marker;
    for (const QString &name : {QString(), record.path}) {
        const QString marker = CrashMarker(format, "folder", record, name).path();
        const QString file = marker.mid(7);
        require(marker.startsWith("folder/") && !anyHolds({file}, "/\\:\n") && !file.startsWith('.'),
                "a marker lies in its folder, to be seen");
        require(file.endsWith(QLatin1String(format.ending)) && file.toUtf8().size() <= 255,
                "a marker has its ending and a name that a file system takes");
    }
}
