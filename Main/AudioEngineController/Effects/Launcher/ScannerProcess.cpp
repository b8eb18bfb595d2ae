#include "Main/AudioEngineController/Effects/Launcher/ScannerProcess.h"

#include "Core/BaseLib/Process/TerminationRequest.h"
#include "Main/AudioEngineController/Effects/Launcher/ScannerChild.h"

#include <QCoreApplication>
#include <QDeadlineTimer>
#include <QProcessEnvironment>

#include <algorithm>
#include <thread>

namespace {

/// What a scanner gets to end by itself: its own patience with a plug-in is two seconds.
constexpr std::chrono::milliseconds kPatience(4000);
constexpr qint64 kLook = 100;    ///< ms
constexpr int kMaxOutput = 2000; ///< bytes
/// NOTE: Wine 8 at times starts no process ("Internal error") on a busy machine where others are crashing.
constexpr int kStartAttempts = 3;

} // namespace

ScannerProcess::ScannerProcess()
    : m_child(std::make_unique<ScannerChild>())
{
    m_child->setProcessChannelMode(QProcess::MergedChannels);
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.insert(QLatin1String(TerminationSignal::kParentVariable),
                       QString::number(QCoreApplication::applicationPid()));
    m_child->setProcessEnvironment(environment);
}

ScannerProcess::~ScannerProcess() { end(); }

void ScannerProcess::setEnvironment(const QString &variable, const QString &value)
{
    QProcessEnvironment environment = m_child->processEnvironment();
    environment.insert(variable, value);
    m_child->setProcessEnvironment(environment);
}

void ScannerProcess::setEnvironment(const char *variable, int value)
{
    setEnvironment(QString::fromLatin1(variable), QString::number(value));
}

bool ScannerProcess::start(const QString &program, const QStringList &arguments,
                           std::chrono::milliseconds timeout)
{
    const QDeadlineTimer deadline(timeout);
    for (int attempt = 0; attempt < kStartAttempts && !m_started && !deadline.hasExpired(); ++attempt) {
        m_child->start(program, arguments, QIODevice::ReadWrite);
        m_started = m_child->waitForStarted(static_cast<int>(deadline.remainingTime()));
    }
    return m_started;
}

bool ScannerProcess::waitForFinished(std::chrono::milliseconds timeout)
{
    if (!m_started) {
        std::this_thread::sleep_for(timeout);
        return false;
    }
    // NOTE: QProcess::waitForFinished does not see its time run out while the process prints without a pause.
    const QDeadlineTimer deadline(timeout);
    while (m_child->state() != QProcess::NotRunning && !deadline.hasExpired()) {
        m_child->waitForReadyRead(static_cast<int>(std::min<qint64>(kLook, deadline.remainingTime())));
        m_output = (m_output + m_child->readAll()).right(kMaxOutput);
    }
    return m_child->state() == QProcess::NotRunning;
}

bool ScannerProcess::write(const QByteArray &bytes)
{
    constexpr int kWritePatience = 1000; // ms
    return m_child->write(bytes) == bytes.size() && m_child->waitForBytesWritten(kWritePatience);
}

void ScannerProcess::end()
{
    if (m_child->state() == QProcess::NotRunning)
        return;
    m_child->terminate(); // SIGTERM, or WM_CLOSE to its windows, of which it has one for this
    if (!waitForFinished(kPatience))
        kill();
}

void ScannerProcess::kill()
{
    m_child->kill();
    waitForFinished(kPatience);
}

int ScannerProcess::errorCode() const { return m_child->error(); }

QString ScannerProcess::errorText() const { return m_child->errorString(); }

bool ScannerProcess::hasCrashed() const { return m_child->exitStatus() == QProcess::CrashExit; }

int ScannerProcess::exitCode() const { return m_child->exitCode(); }

QString ScannerProcess::takeOutput()
{
    QByteArray output;
    output.swap(m_output);
    return QString::fromUtf8(output).trimmed();
}
