#pragma once

#include "Main/VLib/ApplicationContext.h"

/// Stands in for the workstation inside the scanner process: it answers the two things that a scan asks for.
class QuillonInterfaceImpl : public IQuillonInterface {
public:
    QuillonInterfaceImpl(const QString &dataFolder, const QStringList &scanFolders);

    QString dataFolder() const override { return m_dataFolder; }
    QStringList scanFolders() const override { return m_scanFolders; }
    bool isScanner() const override { return true; }
    /// The workstation sees the catalogue files change; nobody in this process shows plug-in lists.
    void pluginListsChanged() override {}

private:
    QString m_dataFolder;
    QStringList m_scanFolders;
};
