#pragma once

#include "Workstation/Summary/ScanSummary.h"

#include <functional>
#include <map>

/// Chooses what of a summary is shown.
class PluginFilter {
public:
    /// Words as `--only` takes them: a state ("failed", "switched-off"), a format's key, "favourite",
    /// "instrument", "category=NAME", "vendor=TEXT". Of several words of one kind one must fit, and one of
    /// each kind. Without a word everything is shown.
    explicit PluginFilter(const QStringList &words);

    /// Takes out of the summary what is not shown. What the scan itself came to stays.
    void apply(ScanSummary &summary) const;
    /// Whether a probe is shown: only its format and what it came to are known then.
    bool fits(PluginFormat format, ProbeStatus status) const;

private:
    enum class Kind { State, Format, Mark, Category, Vendor };

    static Kind kindOf(const QString &word);
    bool fits(const CataloguedPlugin &plugin) const;
    bool fits(const PluginFormatInfo &format, PluginState state) const;
    bool fitsAll(const std::function<bool(Kind kind, const QString &word)> &isOne) const;

    std::map<Kind, QStringList> m_words;
};
