#pragma once

#include "Tests/Support/ScanBench.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

using States = std::map<QString, QString>; ///< by name

/// The real fxscan with the real scanner on scripted plug-ins.
class FxScanBench : public ScanBench {
protected:
    FxScanBench() { prepare(m_fxscan, {}); }

    void prepare(ScannerRun &fxscan, const QStringList &options) const
    {
        fxscan.removeEnvironment("FXPROBE_LOG");
        fxscan.setArguments(QStringList({"--data-folder", m_folder.dataFolder()}) + options);
    }
    ScannerOutcome run(const QStringList &options)
    {
        forgetTrace();
        prepare(m_fxscan, options);
        const ScannerOutcome &outcome = m_fxscan.run();
        keepJson(options, outcome.standardOutput);
        return outcome;
    }
    /// Lays what was printed as JSON down for the check of all of it against its schema.
    void keepJson(const QStringList &options, const QByteArray &output)
    {
        const int format = options.indexOf("--format");
        if (output.isEmpty() || format < 0 || !options.value(format + 1).startsWith("json"))
            return;
        const testing::TestInfo &test = *testing::UnitTest::GetInstance()->current_test_info();
        m_folder.write(QStringLiteral(FXPROBE_JSON_FOLDER "/%1.%2-%3.%4")
                           .arg(test.test_suite_name())
                           .arg(test.name())
                           .arg(++m_kept)
                           .arg(options[format + 1]),
                       output);
    }
    /// Starts a scan without a limit and waits until it hangs in its second plug-in.
    bool startHanging(const QByteArray &script, const QStringList &options = {})
    {
        put("Earlier.vst3");
        put("Hang.vst3", script);
        prepare(m_fxscan, QStringList({"--timeout", "0", m_folder.plugins()}) + options);
        return m_fxscan.start() && waitForStage(m_fxscan, "Hang", "initialize");
    }
    /// What a scan of "Plugins" tells, which has to end with this code.
    QJsonObject scan(const QStringList &options = {}, int exitCode = 0)
    {
        const ScannerOutcome outcome = run(QStringList({"--format", "json", m_folder.plugins()}) + options);
        const QJsonDocument document = QJsonDocument::fromJson(outcome.standardOutput);
        EXPECT_TRUE(document.isObject() && outcome.exitCode == exitCode)
            << outcome.exitCode << '\n'
            << outcome.standardError.constData() << outcome.standardOutput.constData();
        return document.object();
    }
    static States states(const QJsonObject &result)
    {
        States states;
        for (const QJsonValue plugin : result["plugins"].toArray())
            states[plugin["name"].toString()] = plugin["state"].toString();
        return states;
    }
    static QString reason(const QJsonObject &result, const QString &name)
    {
        for (const QJsonValue failure : result["failures"].toArray())
            if (failure["name"].toString() == name)
                return failure["reason"].toString();
        return "(none)";
    }
    static int number(const QJsonObject &result, const char *key)
    {
        return result["scan"].toObject()[QLatin1String(key)].toInt(-1);
    }

    int m_kept = 0; ///< outputs
    ScannerRun m_fxscan{QStringLiteral(FXPROBE_FXSCAN), m_folder};
};
