#include "Main/VLib/QtWarnings.h"

#include "Core/BaseLib/Log/DebugLog.h"

#include <QtGlobal>

#include <thread>

namespace {

QtMessageHandler otherMessages = nullptr;
std::thread::id applicationThread;

void onQtMessage(QtMsgType type, const QMessageLogContext &context, const QString &text)
{
    const bool isOfNoUse = type == QtWarningMsg || type == QtInfoMsg;
    if (isOfNoUse && std::this_thread::get_id() == applicationThread)
        DebugTrace(L"Qt: %ls", text);
    else
        otherMessages(type, context, text);
}

} // namespace

void traceQtWarnings()
{
    applicationThread = std::this_thread::get_id();
    otherMessages = qInstallMessageHandler(onQtMessage);
}
