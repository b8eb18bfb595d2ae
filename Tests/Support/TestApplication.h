#pragma once

#include "Main/VLib/ApplicationContext.h"

#include <atomic>

/// Plays the application that the registry and its hosts ask, and counts what it is told.
class TestApplication : public HostApplication {
public:
    explicit TestApplication(const QStringList &scanFolders = {}, bool isScanner = false)
        : HostApplication(QString(), scanFolders)
        , folders(scanFolders)
        , scanner(isScanner)
    {}
    QStringList scanFolders() const override { return folders; }
    bool isScanner() const override { return scanner; }
    void pluginListsChanged() override { ++changes; }

    QStringList folders;
    bool scanner;
    std::atomic<int> changes{0};
};
