#pragma once

#include <QDialog>
#include <QString>

#include <functional>
#include <memory>
#include <thread>

class ElidedLabel;
class FxProbeUI;
class QCoreApplication;
class QProgressBar;
class QVBoxLayout;
class ScreenLoss;
class StatusHandover;

/// The scanner's window: one line of text and a progress bar. It owns the thread on which the scan runs, and
/// installs itself as the program's user interface while it lives. Belongs to the GUI thread; the operations
/// that other threads may call say so.
class UiFxProbe final : public QDialog {
    Q_OBJECT

public:
    /// Builds the window and starts `scanRun(dataFolder)` on the worker thread at once. What the scan throws
    /// is logged.
    /// @throws std::system_error when the thread cannot be created; the user interface is then not installed.
    UiFxProbe(const QString &dataFolder, std::function<void(const QString &)> scanRun,
              QWidget *parent = nullptr);
    /// Asks the scan to stop and waits for its end, processing events meanwhile.
    ~UiFxProbe() override;

    /// Shows the progress until the scan is over or the user closes the window. With `defaultPath` the window
    /// appears at the first tick, otherwise it stays out of sight until somebody requests it.
    void run(QCoreApplication &application, bool defaultPath);

    /// The range of the bar from the next tick on; equal ends change nothing. Any thread.
    void setRange(int minimum, int maximum);
    /// The text from the next tick on; an empty one changes nothing. Any thread.
    void setText(const QString &text);
    /// Closes the window as its close button would, soon. Any thread.
    void requestClose();
    /// True once the scan is over. Any thread.
    bool isFinished() const;
    /// True when a plug-in ended the scan's thread. On Windows it may hold the loader's lock for ever then,
    /// and whoever starts or ends a thread waits for it. The dialog's thread only.
    bool hasLostThread() const { return m_lostThread; }

    void done(int result) override;

protected:
    void closeEvent(QCloseEvent *event) override;

private Q_SLOTS:
    void OnTimer();

private:
    /// The process-wide user interface, installed for as long as this object lives.
    class Installation {
    public:
        explicit Installation(std::shared_ptr<FxProbeUI> ui);
        ~Installation();
        Installation(const Installation &) = delete;
        Installation &operator=(const Installation &) = delete;

    private:
        std::shared_ptr<FxProbeUI> m_ui;
    };

    void setUpWidgets();
    void setUpWindow();
    void setUpLabel();
    void setUpProgressBar();
    void fixSize();
    void runScan(const std::function<void(const QString &)> &scanRun);
    void markFinished();
    /// Also notices that a plug-in ended the thread.
    bool isScanOver();
    void showWindow();
    void showPendingStatus();
    void endEventLoop();

    QVBoxLayout *m_layout = nullptr;
    ElidedLabel *m_label = nullptr;
    QProgressBar *m_progressBar = nullptr;
    QString m_dataFolder;
    std::shared_ptr<StatusHandover> m_status;
    bool m_lostThread = false;
    /// The window was closed or is going: it must not come back into sight.
    bool m_closed = false;
    std::unique_ptr<Installation> m_installation;
    std::unique_ptr<ScreenLoss> m_screenLoss;
    std::thread m_worker;
};
