#include "Tests/Support/ScannerRun.h"

#include "Tests/Fixtures/FixtureScript.h"
#include "Tests/Support/TestFolder.h"

#include <QEventLoop>
#include <QFile>
#include <QTimer>

#include <gtest/gtest.h>

#include <chrono>
#include <optional>

namespace {

const char kLogFile[] = "scanner.log";
/// The exit code of a process that a sanitizer ended, chosen so that no program of ours has it.
const int kSanitizerExit = 97;
const std::chrono::milliseconds kTimeLimit(100000); ///< CTest waits 120 s
/// NOTE: Wine 8 at times starts no process ("Internal error") on a busy machine where others are crashing.
const int kStartAttempts = 3;

/// Sanitizers leave the faults of plug-ins to the system, so that they end in a signal as they do for a user.
void settleSanitizers(QProcessEnvironment &environment)
{
    const QString settings =
        QStringLiteral(
            "exitcode=%1:handle_segv=0:handle_sigbus=0:handle_sigfpe=0:handle_sigill=0:handle_abort=0")
            .arg(kSanitizerExit);
    for (const char *name : {"ASAN_OPTIONS", "UBSAN_OPTIONS", "TSAN_OPTIONS"}) {
        const QString given = environment.value(name);
        environment.insert(name, given.isEmpty() ? settings : settings + ':' + given);
    }
    // Who leaves by leaveProcess leaves threads that have ended unjoined.
    environment.insert("TSAN_OPTIONS", "report_thread_leaks=0:suppressions=" FXPROBE_RACE_SUPPRESSIONS ":" +
                                           environment.value("TSAN_OPTIONS"));
    environment.insert("LSAN_OPTIONS", "print_suppressions=0:suppressions=" FXPROBE_LEAK_SUPPRESSIONS);
}

/// Waits for the end, or for as long, in a loop of events.
/// NOTE: QProcess::waitForFinished stops to watch the process in the moment in which it ends. Wine 8 may then
/// tell of the end afterwards, in a thread of its own, to an object that is gone.
void waitForEnd(QProcess &process, std::optional<std::chrono::milliseconds> atMost = std::nullopt)
{
    QEventLoop events;
    QObject::connect(&process, QOverload<int, QProcess::ExitStatus>::of(&QProcess::finished), &events,
                     &QEventLoop::quit);
    if (atMost)
        QTimer::singleShot(*atMost, Qt::PreciseTimer, &events, &QEventLoop::quit);
    if (process.state() != QProcess::NotRunning)
        events.exec();
}

} // namespace

ScannerRun::ScannerRun(const QString &program, const TestFolder &folder)
    : m_folder(folder)
    , m_program(program)
    , m_arguments(folder.scanList())
    , m_environment(QProcessEnvironment::systemEnvironment())
{
    m_environment.insert("QT_QPA_PLATFORM", "offscreen");
    m_environment.insert("FXPROBE_LOG", folder.path(QLatin1String(kLogFile)));
    settleSanitizers(m_environment);
}

ScannerRun::~ScannerRun()
{
    if (m_process.state() == QProcess::NotRunning)
        return;
    m_process.kill();
    waitForEnd(m_process);
}

bool ScannerRun::start()
{
    QFile::remove(m_folder.path(QLatin1String(kLogFile)));
    m_outcome = ScannerOutcome();
    m_deadline = QDeadlineTimer(kTimeLimit);
    m_process.setProcessEnvironment(m_environment);
    for (int attempt = 0; attempt < kStartAttempts && !m_outcome.started; ++attempt) {
        m_process.start(m_program, m_arguments);
        m_outcome.started = m_process.waitForStarted(static_cast<int>(kTimeLimit.count()));
    }
    EXPECT_TRUE(m_outcome.started) << qPrintable(m_program) << ": " << qPrintable(m_process.errorString());
    return m_outcome.started;
}

bool ScannerRun::waitUntil(const std::function<bool()> &condition)
{
    while (!condition()) {
        if (m_deadline.hasExpired() || m_process.state() == QProcess::NotRunning)
            return false;
        waitForEnd(m_process, std::chrono::milliseconds(5));
    }
    return true;
}

void ScannerRun::requestTermination(const TerminationWay &way) { ::requestTermination(m_process, way); }

const ScannerOutcome &ScannerRun::wait()
{
    if (!m_outcome.started)
        return m_outcome;
    const bool inTime = waitUntil([this] { return m_process.state() == QProcess::NotRunning; });
    if (!inTime) {
        m_process.kill();
        waitForEnd(m_process);
    }
    m_outcome.standardOutput = m_process.readAllStandardOutput();
    m_outcome.standardError = m_process.readAllStandardError();
    m_outcome.log = QString::fromUtf8(m_folder.read(QLatin1String(kLogFile)));
    const bool bySignal = m_process.exitStatus() == QProcess::CrashExit;
    m_outcome.exitCode = bySignal ? -1 : m_process.exitCode();
    m_outcome.crashed = bySignal || m_outcome.exitCode == kSanitizerExit;
    EXPECT_TRUE(inTime) << qPrintable(m_program) << " overran its time limit and was killed; log:\n"
                        << qPrintable(m_outcome.log);
    EXPECT_NE(m_outcome.exitCode, kFixtureMisused) << m_outcome.standardError.constData();
    for (const char *sign :
         {"ERROR: AddressSanitizer", "ERROR: LeakSanitizer", "WARNING: ThreadSanitizer", "runtime error: "})
        EXPECT_FALSE(m_outcome.standardError.contains(sign)) << m_outcome.standardError.constData();
    return m_outcome;
}
