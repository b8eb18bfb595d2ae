#include <FxProbe/Scan.h>

#include <QCoreApplication>

#include <cstdio>

/// scan DATA-FOLDER PLUG-IN-FOLDER…
int main(int argc, char **argv)
{
    const QCoreApplication application(argc, argv);
    FxProbe::ScanSettings settings;
    settings.dataFolder = QCoreApplication::arguments().value(1);
    settings.folders = QCoreApplication::arguments().mid(2);
    settings.progress = [](const FxProbe::Progress &progress) {
        std::fprintf(stderr, "%d of %d: %s\n", progress.done, progress.planned,
                     qUtf8Printable(progress.name));
    };
    const FxProbe::ScanResult result = FxProbe::scan(settings);
    if (!result)
        std::fprintf(stderr, "%s\n", qUtf8Printable(result.reason));
    for (const FxProbe::Plugin &plugin : FxProbe::readCatalogue(settings.dataFolder).plugins)
        std::printf("%s (%s): %s\n", qUtf8Printable(plugin.name), qUtf8Printable(plugin.format),
                    qUtf8Printable(plugin.isUsable ? plugin.state : plugin.reason));
    return result ? 0 : 1;
}
