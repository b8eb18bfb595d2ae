#pragma once

#include <QByteArray>
#include <QString>

/// Which of the modules for tests to take.
enum class VST2Fixture {
    Scripted, ///< exports "VSTPluginMain" and does what its script says
    Main,     ///< the same with "main" in its place
    Both,     ///< exports both, and "main" answers null
    NoEntry   ///< a library that exports nothing of a plug-in
};

/// What the names of modules end in: ".so", on Windows ".dll".
QString vst2Ending();

/// Puts a module as NAME with the ending into a folder, with its script beside it: a null script
/// gives no script file, so that the module is a healthy stereo effect named after the file. Returns the
/// module's full path. The statements are in Tests/Fixtures/README.md.
QString addVST2File(const QString &folder, const QString &name, const QByteArray &script = {},
                    VST2Fixture fixture = VST2Fixture::Scripted);
