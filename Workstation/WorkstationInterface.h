#pragma once

#include "Main/VLib/ApplicationContext.h"

#include <utility>

/// The workstation as the plug-in hosts see it, played by fxscan.
class WorkstationInterface : public IQuillonInterface {
public:
    WorkstationInterface(QString dataFolder, QStringList scanFolders)
        : m_dataFolder(std::move(dataFolder))
        , m_scanFolders(std::move(scanFolders))
    {
        ApplicationContext::instance().quillonInterface = this;
    }
    ~WorkstationInterface() override { ApplicationContext::instance().quillonInterface = nullptr; }
    WorkstationInterface(const WorkstationInterface &) = delete;
    WorkstationInterface &operator=(const WorkstationInterface &) = delete;

    QString dataFolder() const override { return m_dataFolder; }
    QStringList scanFolders() const override { return m_scanFolders; }
    bool isScanner() const override { return false; }
    /// The catalogue is read when the scan is over.
    void pluginListsChanged() override {}

private:
    QString m_dataFolder;
    QStringList m_scanFolders;
};
