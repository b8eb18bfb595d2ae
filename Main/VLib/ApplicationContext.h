#pragma once

#include <QString>
#include <QStringList>

/// What the plug-in hosts ask of the application that they run in: the workstation, or the scanner in its
/// place. Answers are read on the scan worker and must not change while a scan runs.
class IQuillonInterface {
public:
    virtual ~IQuillonInterface() = default;

    /// The workstation's data folder, without a separator at its end.
    virtual QString dataFolder() const = 0;
    /// The folders to scan, in the order of the scan list.
    virtual QStringList scanFolders() const = 0;
    /// True in the scanner process, which reads the scan list and the marks on built-in effects but owns
    /// neither.
    virtual bool isScanner() const = 0;
    /// Tells that the plug-in lists changed. Posted, never waited for; any thread.
    virtual void pluginListsChanged() = 0;
};

/// The process-wide road to the host application. Made on first use, from any thread.
class ApplicationContext {
public:
    static ApplicationContext &instance();

    /// The host application's services, or null while none are installed; not owned.
    IQuillonInterface *quillonInterface = nullptr;

private:
    ApplicationContext() = default;
};

/// The host application of a process that has settled its folders: the scanner, or a program that plays the
/// workstation. Its services are the process's for as long as the object lives.
class HostApplication : public IQuillonInterface {
public:
    HostApplication(const QString &dataFolder, const QStringList &scanFolders);
    ~HostApplication() override;
    HostApplication(const HostApplication &) = delete;
    HostApplication &operator=(const HostApplication &) = delete;

    QString dataFolder() const override { return m_dataFolder; }
    QStringList scanFolders() const override { return m_scanFolders; }
    bool isScanner() const override { return false; }
    /// Nothing: such a program reads the catalogues when a scan is over.
    void pluginListsChanged() override {}

private:
    const QString m_dataFolder;
    const QStringList m_scanFolders;
};
