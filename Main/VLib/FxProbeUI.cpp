#include "Main/VLib/FxProbeUI.h"

#include "Main/VLib/StatusHandover.h"
#include "Main/VLib/VSTProgress.h"

#include <QCoreApplication>

#include <utility>

FxProbeUI::FxProbeUI(std::shared_ptr<StatusHandover> status)
    : m_status(std::move(status))
{}

// The events are those of the calling thread: plug-ins may have left some on the scan's thread, which has no
// event loop.
void FxProbeUI::showStatus(const QString &text)
{
    QCoreApplication::processEvents();
    m_status->setText(text);
    QCoreApplication::processEvents();
}

void FxProbeUI::showStatus(int, const QString &text) { showStatus(text); }

void FxProbeUI::notify(quint32) { QCoreApplication::processEvents(); }

std::shared_ptr<VProgressDisplay> FxProbeUI::createProgressDisplay()
{
    return std::make_shared<VSTProgress>(m_status);
}

void FxProbeUI::requestShow() { m_status->requestShow(); }
