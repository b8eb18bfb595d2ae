#pragma once

#include "Main/VLib/ApplicationContext.h"

/// Stands in for the workstation inside the scanner process. The workstation sees the catalogue files change;
/// nobody in this process shows plug-in lists.
class QuillonInterfaceImpl : public HostApplication {
public:
    using HostApplication::HostApplication;

    bool isScanner() const override { return true; }
};
