#include "Tests/Support/VST3Fixture.h"

#include "Tests/Support/FixtureFile.h"
#include "Tests/Support/PlatformValues.h"

#include <QFileInfo>

namespace {

QString modulePathIn(const QString &folder, const QString &name) { return folder + '/' + name + ".vst3"; }

} // namespace

QString vst3FixturePath(VST3Fixture fixture)
{
    switch (fixture) {
    case VST3Fixture::Plain:
        return QStringLiteral(FXPROBE_PLAIN_VST3);
    case VST3Fixture::NoEntry:
        return QStringLiteral(FXPROBE_NO_ENTRY_VST3);
    case VST3Fixture::Scripted:
        break;
    }
    return QStringLiteral(FXPROBE_SCRIPTED_VST3);
}

QString addVST3File(const QString &folder, const QString &name, const QByteArray &script, VST3Fixture fixture)
{
    const QString path = modulePathIn(folder, name);
    putFixture(vst3FixturePath(fixture), path, script);
    return path;
}

QString addVST3Bundle(const QString &folder, const QString &name, const QByteArray &script,
                      VST3Fixture fixture)
{
    const QString bundle = modulePathIn(folder, name);
    putFixture(vst3FixturePath(fixture), vst3BundleBinary(bundle), script);
    return bundle;
}

QString vst3BundleBinary(const QString &bundle)
{
    return bundle + "/Contents/" + QLatin1String(kBundleFolder) + '/' + QFileInfo(bundle).completeBaseName() +
           QLatin1String(kBundleEnding);
}

QString vst3BundlePath(const QString &bundle)
{
    return kBundleIsThePlugin ? bundle : vst3BundleBinary(bundle);
}
