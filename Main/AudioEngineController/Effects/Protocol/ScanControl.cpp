#include "Main/AudioEngineController/Effects/Protocol/ScanControl.h"

#include "Core/BaseLib/Files/NativeFile.h"
#include "Core/BaseLib/Process/StandardInput.h"

#include <QJsonDocument>
#include <QJsonObject>

namespace {

constexpr char kSkip[] = "skip";
/// Far more than a path takes; what is longer was written by somebody else.
constexpr int kLongestLine = 1 << 18; // bytes

} // namespace

ScanControl::ScanControl()
    : m_listens(qEnvironmentVariableIntValue(kVariable) == 1)
{}

ScanControl &ScanControl::instance()
{
    static ScanControl control;
    return control;
}

bool ScanControl::isSkipped(const QString &path)
{
    if (!m_listens)
        return false;
    m_rest += StandardInput::takeArrived();
    int from = 0;
    for (int end = m_rest.indexOf('\n'); end >= 0; end = m_rest.indexOf('\n', from)) {
        takeLine(m_rest.mid(from, end - from));
        from = end + 1;
    }
    m_rest.remove(0, from);
    if (m_rest.size() > kLongestLine)
        m_rest.clear();
    return m_skips.contains(pathKey(path));
}

void ScanControl::takeLine(const QByteArray &line)
{
    const QString path = QJsonDocument::fromJson(line).object().value(QLatin1String(kSkip)).toString();
    if (!path.isEmpty())
        m_skips.insert(pathKey(path));
}

QByteArray ScanControl::skipLine(const QString &path)
{
    return QJsonDocument(QJsonObject{{QLatin1String(kSkip), path}}).toJson(QJsonDocument::Compact) + '\n';
}
