#pragma once

#include "Workstation/Summary/PluginFilter.h"
#include "Workstation/Summary/ScanAccount.h"

#include <QJsonObject>
#include <QStringList>

/// Prints what comes to pass in a scan while it goes on, each as one JSON object a line that is flushed at
/// once. docs/fxscan.schema.json describes the lines. Prints nothing when it is not asked to.
class JsonLines {
public:
    /// What the member "schema" says: it grows when a member changes its meaning or goes.
    static constexpr int kSchema = 2;

    /// `only`: the words of `--only`.
    JsonLines(bool isAskedFor, const QStringList &only)
        : m_isAskedFor(isAskedFor)
        , m_filter(only)
    {}

    /// The first line: what is to be scanned.
    void begin(const QString &dataFolder, const QStringList &folders);
    /// What is new since the last call.
    void show(ScanAccount &account);
    /// True when nobody takes what is printed, so that going on is in vain.
    bool isBroken() const { return m_isBroken; }

private:
    void print(const QJsonObject &line);

    bool m_isAskedFor;
    PluginFilter m_filter;
    bool m_isBroken = false;
};
