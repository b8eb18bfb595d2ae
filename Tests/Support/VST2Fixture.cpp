#include "Tests/Support/VST2Fixture.h"

#include "Tests/Support/FixtureFile.h"
#include "Tests/Support/PlatformValues.h"

QString vst2Ending() { return QLatin1String(kVst2Ending); }

QString vst2FixturePath(VST2Fixture fixture)
{
    switch (fixture) {
    case VST2Fixture::Main:
        return QStringLiteral(FXPROBE_MAIN_VST2);
    case VST2Fixture::Both:
        return QStringLiteral(FXPROBE_BOTH_VST2);
    case VST2Fixture::NoEntry:
        return QStringLiteral(FXPROBE_NO_ENTRY_VST3);
    case VST2Fixture::Scripted:
        break;
    }
    return QStringLiteral(FXPROBE_SCRIPTED_VST2);
}

QString addVST2File(const QString &folder, const QString &name, const QByteArray &script, VST2Fixture fixture)
{
    const QString path = folder + '/' + name + vst2Ending();
    putFixture(vst2FixturePath(fixture), path, script);
    return path;
}
