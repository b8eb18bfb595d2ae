#include "Main/AudioEngineController/Effects/ScannerProcess.h"

#include "Main/AudioEngineController/Effects/ScannerChild.h"

#include <thread>

namespace {

/// What a scanner gets to end by itself: its own patience with a plug-in is two seconds.
constexpr int kPatience = 4000;
constexpr int kMaxOutput = 2000; ///< characters

} // namespace

ScannerProcess::ScannerProcess()
    : m_child(std::make_unique<ScannerChild>())
{
    m_child->setProcessChannelMode(QProcess::MergedChannels);
}

ScannerProcess::~ScannerProcess() { end(); }

bool ScannerProcess::start(const QString &program, const QStringList &arguments,
                           std::chrono::milliseconds timeout)
{
    m_child->start(program, arguments, QIODevice::ReadWrite);
    m_started = m_child->waitForStarted(static_cast<int>(timeout.count()));
    if (m_started)
        m_child->tieToThisProcess();
    return m_started;
}

bool ScannerProcess::waitForFinished(std::chrono::milliseconds timeout)
{
    if (!m_started) {
        std::this_thread::sleep_for(timeout);
        return false;
    }
    return m_child->waitForFinished(static_cast<int>(timeout.count())) ||
           m_child->state() == QProcess::NotRunning;
}

void ScannerProcess::end()
{
    if (m_child->state() == QProcess::NotRunning)
        return;
    if (!m_child->requestEnd() || !m_child->waitForFinished(kPatience))
        kill();
}

void ScannerProcess::kill()
{
    m_child->kill();
    m_child->waitForFinished(kPatience);
}

int ScannerProcess::errorCode() const { return m_child->error(); }

QString ScannerProcess::errorText() const { return m_child->errorString(); }

bool ScannerProcess::hasCrashed() const { return m_child->exitStatus() == QProcess::CrashExit; }

int ScannerProcess::exitCode() const { return m_child->exitCode(); }

QString ScannerProcess::takeOutput()
{
    return QString::fromLocal8Bit(m_child->readAll().right(kMaxOutput)).trimmed();
}
