#include "Main/VLib/UiFxProbe.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Process/PluginThread.h"
#include "Core/BaseLib/Process/ProcessSetup.h"
#include "Core/BaseLib/Process/TerminationRequest.h"
#include "Main/VLib/ElidedLabel.h"
#include "Main/VLib/FxProbeUI.h"
#include "Main/VLib/ScreenLoss.h"
#include "Main/VLib/SimpleGUI.h"
#include "Main/VLib/StatusHandover.h"

#include <QAccessible>
#include <QCloseEvent>
#include <QGuiApplication>
#include <QProgressBar>
#include <QScopeGuard>
#include <QTimer>
#include <QVBoxLayout>

#include <cxxabi.h>

#include <algorithm>
#include <cmath>
#include <utility>

namespace {

constexpr int kWidth = 333;
constexpr int kHeight = 80;
constexpr int kPlainResolution = 96; ///< dots per inch of a display at 100%
constexpr int kTickMilliseconds = 50;
constexpr std::chrono::milliseconds kPollInterval(10);
constexpr wchar_t kThreadEnded[] = L"The scan's thread was ended by a plug-in";

/// Without the screen the user's session is over: the scan ends as on any other request, and no plug-in is
/// blamed.
void endWithoutScreen(StatusHandover &status)
{
    DebugLog(L"The connection to the screen broke");
    status.setClosing();
    TerminationSignal::raise();
    while (!status.isFinished())
        std::this_thread::sleep_for(kPollInterval);
    leaveProcess(0);
}

QPalette labelPalette()
{
    const QBrush brush(QColor(200, 200, 200, 255), Qt::SolidPattern);
    QPalette palette;
    for (const auto group : {QPalette::Active, QPalette::Inactive, QPalette::Disabled})
        for (const auto role : {QPalette::WindowText, QPalette::Text, QPalette::ButtonText})
            palette.setBrush(group, role, brush);
    return palette;
}

/// Other platforms answer such a request with a warning.
bool canComeToFront()
{
    const QString platform = QGuiApplication::platformName();
    return platform == QLatin1String("xcb") || platform == QLatin1String("windows");
}

} // namespace

UiFxProbe::Installation::Installation(std::shared_ptr<FxProbeUI> ui)
    : m_ui(std::move(ui))
{
    installVUI(m_ui);
}

UiFxProbe::Installation::~Installation() { uninstallVUI(m_ui); }

UiFxProbe::UiFxProbe(const QString &dataFolder, std::function<void(const QString &)> scanRun, QWidget *parent)
    : QDialog(parent)
    , m_dataFolder(dataFolder)
    , m_status(std::make_shared<StatusHandover>())
{
    setUpWidgets();
    m_installation = std::make_unique<Installation>(std::make_shared<FxProbeUI>(m_status));
    m_screenLoss = std::make_unique<ScreenLoss>([status = m_status] { endWithoutScreen(*status); });
    setWindowFlags(Qt::Window | Qt::WindowMinimizeButtonHint | Qt::WindowStaysOnTopHint |
                   Qt::WindowCloseButtonHint);
#if QT_CONFIG(accessibility) // Qt may be built without
    // Starts Qt's accessibility thread now rather than when the window is first shown: a thread that starts
    // during a probe would be taken for the plug-in's.
    QAccessible::isActive();
#endif
    m_worker = std::thread([this, scan = std::move(scanRun)] { runScan(scan); });
}

UiFxProbe::~UiFxProbe()
{
    m_closed = true;
    m_status->setClosing();
    // A plug-in may be waiting for this thread to answer a message; without events the join would never end.
    // On the worker itself nothing is waited for: there the join reports the mistake.
    while (!isScanOver() && std::this_thread::get_id() != m_worker.get_id())
        QCoreApplication::processEvents(QEventLoop::WaitForMoreEvents);
    if (m_worker.joinable())
        m_worker.join();
}

void UiFxProbe::setUpWidgets()
{
    setUpWindow();
    setUpLabel();
    setUpProgressBar();
    fixSize();
    setWindowTitle(QCoreApplication::translate("FxProbeClass", "Quillon Audio FX"));
    m_label->setText(QString());
    QMetaObject::connectSlotsByName(this);
}

void UiFxProbe::setUpWindow()
{
    if (objectName().isEmpty())
        setObjectName(QStringLiteral("FxProbeClass"));
    setStyleSheet(QStringLiteral("QDialog {background-color:rgb(55, 57, 62);\nborder: 1px solid black; }\n"));
    m_layout = new QVBoxLayout(this);
    m_layout->setSpacing(6);
    m_layout->setContentsMargins(11, 11, 11, 11);
    m_layout->setObjectName(QStringLiteral("verticalLayout_3"));
    m_layout->setContentsMargins(20, -1, 20, 20); // -1: as the style has it
}

void UiFxProbe::setUpLabel()
{
    m_label = new ElidedLabel(this);
    m_label->setObjectName(QStringLiteral("label"));
    m_label->setPalette(labelPalette());
    QFont font;
    font.setPointSize(10);
    m_label->setFont(font);
    m_label->setStyleSheet(QStringLiteral("color:rgb(200,200,200);"));
    // Texts hold names that plug-ins chose; one that looks like HTML must not be read as such.
    m_label->setTextFormat(Qt::PlainText);
    m_layout->addWidget(m_label);
}

void UiFxProbe::setUpProgressBar()
{
    m_progressBar = new QProgressBar(this);
    m_progressBar->setObjectName(QStringLiteral("progressBar"));
    QSizePolicy policy(QSizePolicy::Expanding, QSizePolicy::Fixed);
    policy.setHorizontalStretch(0);
    policy.setVerticalStretch(0);
    policy.setHeightForWidth(m_progressBar->sizePolicy().hasHeightForWidth());
    m_progressBar->setSizePolicy(policy);
    m_progressBar->setStyleSheet(QStringLiteral("background:rgb(67, 71, 77);\n\n"));
    m_progressBar->setValue(24);
    m_progressBar->setTextVisible(false);
    m_layout->addWidget(m_progressBar);
}

// Fonts follow the display's resolution, so the window does, whether Qt scales it or not. Only in whole
// quarters: a resolution of 100 is what servers without a display make up.
void UiFxProbe::fixSize()
{
    const qreal ratio = devicePixelRatioF();
    const qreal scale = std::floor(4 * ratio * logicalDpiY() / kPlainResolution) / 4;
    setFixedSize((QSizeF(kWidth, kHeight) * std::max(1.0, scale) / ratio).toSize());
}

// The exception of a forced unwind has no object, so the reference to it is null; that is how the compiler
// does it.
[[gnu::no_sanitize("null")]] void UiFxProbe::runScan(const std::function<void(const QString &)> &scanRun)
{
    const auto finished = qScopeGuard([this] { markFinished(); });
    try {
        scanRun(m_dataFolder);
    } catch (const abi::__forced_unwind &) {
        // A plug-in ended the thread with pthread_exit; swallowing that would abort the process.
        DebugLog(kThreadEnded);
        throw;
    } catch (const std::exception &exception) {
        DebugLog(L"The scan ended with an exception: %s", exception.what());
    } catch (...) {
        DebugLog(L"The scan ended with an unknown exception");
    }
}

void UiFxProbe::markFinished()
{
    m_status->setFinished();
    // Ticks at once: most scans find nothing new, and their end need not wait for the timer. It also wakes
    // the destructor, which may be waiting for the next event.
    QMetaObject::invokeMethod(this, &UiFxProbe::OnTimer, Qt::QueuedConnection);
}

bool UiFxProbe::isScanOver()
{
    // In this order: a scan that returns is finished before its thread has ended.
    if (PluginThread::hasEndedAlone(m_worker) && !m_status->isFinished()) {
        DebugLog(kThreadEnded);
        m_lostThread = true;
        m_status->setFinished();
    }
    return m_status->isFinished();
}

void UiFxProbe::run(QCoreApplication &application, bool defaultPath)
{
    if (defaultPath)
        m_status->requestShow();
    else
        // Not setWindowState: on X11 it creates the window at once, and taking the state back would then map
        // it before it has the hint that keeps it on top.
        overrideWindowState(Qt::WindowMinimized);
    auto *timer = new QTimer(this);
    connect(timer, &QTimer::timeout, this, &UiFxProbe::OnTimer);
    timer->start(kTickMilliseconds);
    // When it was closed before the loop started, nothing would end the loop.
    if (!m_closed)
        application.exec();
}

void UiFxProbe::OnTimer()
{
    if (m_closed)
        return;
    if (isScanOver()) {
        close();
        return;
    }
    if (m_status->takeShowRequest())
        showWindow();
    showPendingStatus();
    QCoreApplication::processEvents();
}

void UiFxProbe::showWindow()
{
    setWindowState(Qt::WindowNoState);
    show();
    if (canComeToFront()) {
        raise();
        activateWindow();
    }
}

void UiFxProbe::showPendingStatus()
{
    const PendingStatus pending = m_status->take();
    if (!pending.text.isEmpty())
        m_label->setText(pending.text);
    if (pending.minimum != pending.maximum) {
        m_progressBar->setMinimum(pending.minimum);
        m_progressBar->setMaximum(pending.maximum);
    }
    if (pending.value != -1)
        m_progressBar->setValue(pending.value);
}

void UiFxProbe::setRange(int minimum, int maximum) { m_status->setRange(minimum, maximum); }

void UiFxProbe::setText(const QString &text) { m_status->setText(text); }

void UiFxProbe::requestClose() { QMetaObject::invokeMethod(this, "close", Qt::QueuedConnection); }

bool UiFxProbe::isFinished() const { return m_status->isFinished(); }

void UiFxProbe::closeEvent(QCloseEvent *event)
{
    QDialog::closeEvent(event);
    if (event->isAccepted())
        endEventLoop();
}

// The Escape key comes here without a close event.
void UiFxProbe::done(int result)
{
    QDialog::done(result);
    endEventLoop();
}

// Not left to Qt, which ends the loop only when no other window of the process is visible: plug-ins may have
// some.
void UiFxProbe::endEventLoop()
{
    m_closed = true;
    QCoreApplication::quit();
}
