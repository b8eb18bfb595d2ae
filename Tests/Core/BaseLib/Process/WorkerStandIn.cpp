// A worker that behaves as its second argument says.

#include "Core/BaseLib/Process/WorkerGroup.h"

#include <QCoreApplication>
#include <QProcess>

#include <cstdio>
#include <thread>

namespace {

[[noreturn]] void hang()
{
    while (true)
        std::this_thread::sleep_for(std::chrono::hours(1));
}

/// Starts a process that hangs, and tells its number.
void startAnother(WorkerChannel &channel, bool isDetached)
{
    const QString program = QCoreApplication::applicationFilePath();
    const QStringList arguments{QStringLiteral("hang")};
    qint64 number = 0;
    if (isDetached) {
        QProcess::startDetached(program, arguments, QString(), &number);
    } else {
        auto *const process = new QProcess; // lives as long as this process
        process->start(program, arguments);
        number = process->waitForStarted() ? process->processId() : 0;
    }
    channel.write(QByteArray::number(number) + '\n');
}

} // namespace

int main(int argc, char **argv)
{
    const QCoreApplication application(argc, argv);
    const QString way = QString::fromLocal8Bit(argc > 1 ? argv[1] : "");
    if (way == QLatin1String("hang"))
        hang();
    if (!WorkerChannel::isThere())
        return 99;
    {
        WorkerChannel channel;
        if (way == QLatin1String("child") || way == QLatin1String("detached"))
            startAnother(channel, way == QLatin1String("detached"));
        std::printf("%s: input %s\n", argv[1], std::getchar() == EOF ? "empty" : "there");
        std::fflush(stdout);
        if (way == QLatin1String("crash"))
            __builtin_trap();
        if (way == QLatin1String("close"))
            channel.write("closing\n");
        else
            for (QByteArray bytes = channel.read(); !bytes.isEmpty(); bytes = channel.read()) {
                if (bytes == "leave")
                    return 7;
                channel.write(bytes);
            }
    }
    hang();
}
