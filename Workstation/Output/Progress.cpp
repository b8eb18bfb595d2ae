#include "Workstation/Output/Progress.h"

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Workstation/Output/Terminal.h"
#include "Workstation/Summary/ScanAccount.h"

namespace {

constexpr double kSlow = 2000; ///< ms after which the time of a probe is shown

QString countOf(int done, int planned) { return QStringLiteral("[%1/%2]").arg(done).arg(planned); }

QString nameOf(const ScanAccount &account, const PluginKey &key)
{
    const ProbeAccount *probe = account.find(key);
    const QString part =
        probe && !probe->subName.isEmpty() ? QStringLiteral(", %1").arg(probe->subName) : QString();
    return QStringLiteral("%1  %2%3")
        .arg(QLatin1String(formatInfo(key.format).title), fileNameOf(key.path), part);
}

} // namespace

Progress::Progress(bool isQuiet, int limit)
    : m_isQuiet(isQuiet)
    , m_isTerminal(Terminal::errorIsTerminal())
    , m_limit(limit)
{}

void Progress::end()
{
    if (!m_line.isEmpty())
        Terminal::printError(QStringLiteral("\r\x1b[K"));
    m_line.clear();
}

void Progress::say(const QString &text)
{
    if (m_isQuiet)
        return;
    end();
    Terminal::printError(Terminal::harmless(text) + QLatin1Char('\n'));
}

void Progress::show(ScanAccount &account, bool hasKeys)
{
    if (m_isQuiet)
        return;
    if (!account.looking().isEmpty())
        showLooking(account.looking());
    else if (!m_isTerminal)
        showLines(account);
    else if (const PluginKey *key = account.current())
        showLine(account, *key, hasKeys);
}

void Progress::showLines(ScanAccount &account)
{
    for (const BegunProbe &begun : account.takeBegun())
        Terminal::printError(Terminal::harmless(countOf(begun.done, begun.planned) + QLatin1Char(' ') +
                                                nameOf(account, begun.key)) +
                             QLatin1Char('\n'));
}

void Progress::showLine(const ScanAccount &account, const PluginKey &key, bool hasKeys)
{
    const ProbeAccount *probe = account.find(key);
    const double at = probe && probe->span ? account.now() - account.spans()[*probe->span].begin : 0;
    const QString keys = hasKeys ? QStringLiteral("; s skips it, q cancels") : QString();
    const QString time = at < kSlow ? QString() : QLatin1String("  ") + timeText(at, keys);
    showText(countOf(account.done(), account.planned()) + QLatin1Char(' ') + nameOf(account, key) + time);
}

/// A folder that gives no answer.
void Progress::showLooking(const QString &folder)
{
    const QString text = QStringLiteral("Looking in %1").arg(folder);
    if (folder != m_looking) {
        m_since.start();
        if (!m_isTerminal)
            Terminal::printError(Terminal::harmless(text) + QLatin1Char('\n'));
    }
    m_looking = folder;
    if (m_isTerminal)
        showText(text + QLatin1Char(' ') + timeText(static_cast<double>(m_since.elapsed())));
}

/// "(12 s of 60)"
QString Progress::timeText(double milliseconds, const QString &keys) const
{
    const QString limit = m_limit > 0 ? QStringLiteral(" of %1").arg(m_limit) : QString();
    return QStringLiteral("(%1 s%2%3)").arg(static_cast<int>(milliseconds / 1000)).arg(limit, keys);
}

void Progress::showText(const QString &given)
{
    const QString text = Terminal::harmless(given);
    const QString line = Terminal::cell(text, Terminal::errorWidth() - 1).trimmed();
    if (line == m_line)
        return;
    Terminal::printError(QStringLiteral("\r\x1b[K") + line);
    m_line = line;
}
