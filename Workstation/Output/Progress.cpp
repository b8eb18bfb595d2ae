#include "Workstation/Output/Progress.h"

#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Workstation/Output/Terminal.h"
#include "Workstation/Summary/ScanAccount.h"

namespace {

constexpr qint64 kSlow = 2000; ///< ms after which the time of a probe is shown

QString countOf(const ScanAccount &account)
{
    return QStringLiteral("[%1/%2]").arg(account.done()).arg(account.planned());
}

QString nameOf(const ScanAccount &account, const PluginKey &key)
{
    const ProbeAccount *probe = account.find(key);
    const QString part =
        probe && !probe->subName.isEmpty() ? QStringLiteral(", %1").arg(probe->subName) : QString();
    return QStringLiteral("%1  %2%3")
        .arg(QLatin1String(formatInfo(key.format).title), fileNameOf(key.path), part);
}

} // namespace

Progress::Progress(bool isQuiet, int limit, QString keys)
    : m_isQuiet(isQuiet)
    , m_isTerminal(Terminal::errorIsTerminal())
    , m_limit(limit)
    , m_keys(std::move(keys))
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

void Progress::show(ScanAccount &account)
{
    if (m_isQuiet)
        return;
    if (!account.looking().isEmpty())
        showLooking(account.looking());
    else if (!m_isTerminal)
        showLines(account);
    else if (const PluginKey *key = account.current())
        showLine(account, *key);
}

void Progress::showLines(ScanAccount &account)
{
    for (const PluginKey &key : account.takeBegun())
        Terminal::printError(Terminal::harmless(countOf(account) + QLatin1Char(' ') + nameOf(account, key)) +
                             QLatin1Char('\n'));
}

void Progress::showLine(const ScanAccount &account, const PluginKey &key)
{
    if (!(key == m_shown))
        m_since.start();
    m_shown = key;
    const QString time = m_since.elapsed() < kSlow ? QString() : QLatin1String("  ") + timeText(m_keys);
    showText(countOf(account) + QLatin1Char(' ') + nameOf(account, key) + time);
}

/// A folder that gives no answer.
void Progress::showLooking(const QString &folder)
{
    const QString text = QStringLiteral("Looking in %1").arg(folder);
    if (folder != m_looking) {
        m_since.start();
        m_shown = PluginKey();
        if (!m_isTerminal)
            Terminal::printError(Terminal::harmless(text) + QLatin1Char('\n'));
    }
    m_looking = folder;
    if (m_isTerminal)
        showText(text + QLatin1Char(' ') + timeText(QString()));
}

/// "(12 s of 60)"
QString Progress::timeText(const QString &keys) const
{
    const QString limit = m_limit > 0 ? QStringLiteral(" of %1").arg(m_limit) : QString();
    return QStringLiteral("(%1 s%2%3)").arg(m_since.elapsed() / 1000).arg(limit, keys);
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
