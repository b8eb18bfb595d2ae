#pragma once

#include <QByteArray>
#include <QString>

/// Which of the modules for tests to take.
enum class VST3Fixture {
    Scripted, ///< does what its script says
    Plain,    ///< the same, without the functions around a module's life
    NoEntry   ///< a library that exports nothing of a plug-in
};

/// The built module itself.
QString vst3FixturePath(VST3Fixture fixture = VST3Fixture::Scripted);

/// Puts a module as the plain file "NAME.vst3" into a folder, with its script beside it: a null script gives
/// no script file, so that the module has one healthy class named after the file. Returns the module's full
/// path. The statements are in Tests/Fixtures/README.md.
QString addVST3File(const QString &folder, const QString &name, const QByteArray &script = {},
                    VST3Fixture fixture = VST3Fixture::Scripted);

/// The same as a bundle folder "NAME.vst3"; returns the full path of the module in it.
QString addVST3Bundle(const QString &folder, const QString &name, const QByteArray &script = {});
