// The parts of a scan one by one. "N" is a number of records or plug-ins; "big O" at the end of a row says
// how the time grows.

#include "Core/BaseLib/Binary/BinaryExports.h"
#include "Core/BaseLib/Files/FileTime.h"
#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFile.h"
#include "Main/AudioEngineController/Effects/Catalogue/KnownList.h"
#include "Main/AudioEngineController/Effects/Catalogue/VST3Catalogue.h"
#include "Main/AudioEngineController/Effects/Protocol/CrashMarker.h"

#include <QFile>
#include <QTemporaryDir>

#include <benchmark/benchmark.h>

namespace {

constexpr int kFew = 10;
constexpr int kMost = 20000;

EffectRecord recordOf(int number)
{
    EffectRecord record;
    record.path = QStringLiteral("/usr/lib/vst3/Some Vendor Plug-in %1.vst3").arg(number);
    record.fileTime = QStringLiteral("2024-03-09 07:05");
    record.name = QStringLiteral("Some Vendor Plug-in %1").arg(number);
    record.id = QStringLiteral("%1").arg(number, 32, 16, QLatin1Char('0'));
    record.vendor = QStringLiteral("Some Vendor");
    record.categories = QStringLiteral("Fx|Reverb");
    record.inputs = record.outputs = 2;
    return record;
}

std::vector<EffectRecord> recordsOf(benchmark::State &state)
{
    std::vector<EffectRecord> records;
    for (int number = 0; number < state.range(0); ++number)
        records.push_back(recordOf(number));
    state.SetComplexityN(state.range(0));
    return records;
}

/// The text of a catalogue of as many records as the benchmark asks for.
QByteArray catalogueOf(benchmark::State &state)
{
    return renderCatalogue(vst3CatalogueFormat(), recordsOf(state));
}

void write(const QString &path, const QByteArray &content)
{
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly) || file.write(content) != content.size())
        qFatal("cannot write a file for the benchmark");
}

void catalogueRead(benchmark::State &state)
{
    const QTemporaryDir folder;
    const QString path = folder.filePath(QStringLiteral("catalogue.xml"));
    write(path, catalogueOf(state));
    while (state.KeepRunning())
        benchmark::DoNotOptimize(readCatalogueFile(vst3CatalogueFormat(), path));
}
BENCHMARK(catalogueRead)->RangeMultiplier(10)->Range(kFew, kMost)->Complexity(benchmark::oN);

/// What each interim write costs when all records were rendered before.
void catalogueWrite(benchmark::State &state)
{
    std::vector<QByteArray> texts;
    for (const EffectRecord &record : recordsOf(state))
        texts.push_back(renderRecord(vst3CatalogueFormat(), record));
    std::vector<const QByteArray *> places;
    for (const QByteArray &text : texts)
        places.push_back(&text);
    const QTemporaryDir folder;
    const QString path = folder.filePath(QStringLiteral("catalogue.xml"));
    while (state.KeepRunning())
        benchmark::DoNotOptimize(
            replaceFile(path, renderCatalogue(vst3CatalogueFormat(), places), Durability::Buffered));
}
BENCHMARK(catalogueWrite)->RangeMultiplier(10)->Range(kFew, kMost)->Complexity(benchmark::oN);

/// The marker's part of the bracket around a probe.
void markerBracket(benchmark::State &state)
{
    const QTemporaryDir folder;
    const MarkerFormat &format = vst3CatalogueFormat().marker;
    const EffectRecord record = recordOf(1);
    while (state.KeepRunning())
        const CrashMarker marker(format, folder.path(), record);
}
BENCHMARK(markerBracket);

void fileTime(benchmark::State &state)
{
    while (state.KeepRunning())
        benchmark::DoNotOptimize(fileTimeText(QStringLiteral(FXPROBE_BENCH_MODULE)));
}
BENCHMARK(fileTime);

/// Of a module of this system, and of Windows.
void exports(benchmark::State &state, const char *module)
{
    while (state.KeepRunning())
        benchmark::DoNotOptimize(findExports(QString::fromUtf8(module), {"VSTPluginMain", "main"}));
}
BENCHMARK_CAPTURE(exports, elf, FXPROBE_BENCH_MODULE);
BENCHMARK_CAPTURE(exports, pe, FXPROBE_BENCH_WINDOWS_MODULE);

/// Finding a file in a catalogue of as many records.
void knownLookUp(benchmark::State &state)
{
    KnownList known;
    for (const EffectRecord &record : recordsOf(state))
        known.addRecord(record);
    const QString path = recordOf(static_cast<int>(state.range(0)) / 2).path;
    while (state.KeepRunning())
        benchmark::DoNotOptimize(known.recordsOfPath(path));
}
BENCHMARK(knownLookUp)->RangeMultiplier(10)->Range(kFew, kMost)->Complexity(benchmark::oLogN);

} // namespace

BENCHMARK_MAIN();
