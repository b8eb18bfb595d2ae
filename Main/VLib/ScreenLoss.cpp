#include "Main/VLib/ScreenLoss.h"

#include <QCoreApplication>
#include <QThread>

#include <utility>

namespace {

std::function<void()> screenLost;
QtMessageHandler otherMessages = nullptr;

// NOTE: Qt ends the process when the X server or the compositor goes away (exit(1) here, _exit(1) there). The
// message it writes just before is the only sign that comes in time: exit handlers would run too late, after
// those of the plug-in at hand.
void onQtMessage(QtMsgType type, const QMessageLogContext &context, const QString &text)
{
    otherMessages(type, context, text);
    const bool isOurs = qApp && QThread::currentThread() == qApp->thread();
    if (isOurs && text.startsWith(QLatin1String("The ")) && text.contains(QLatin1String(" connection broke")))
        screenLost();
}

} // namespace

ScreenLoss::ScreenLoss(std::function<void()> lost)
{
    screenLost = std::move(lost);
    otherMessages = qInstallMessageHandler(onQtMessage);
}

ScreenLoss::~ScreenLoss() { qInstallMessageHandler(otherMessages); }
