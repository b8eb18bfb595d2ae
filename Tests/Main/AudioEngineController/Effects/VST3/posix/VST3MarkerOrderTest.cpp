#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QFile>

#include <sys/inotify.h>
#include <unistd.h>

namespace {

/// What happens to the files of one folder, in the order in which it happens, as "EVENT NAME".
class FolderWatch {
public:
    explicit FolderWatch(const QString &folder)
        : m_queue(inotify_init1(IN_NONBLOCK | IN_CLOEXEC))
    {
        const int watch = inotify_add_watch(m_queue, QFile::encodeName(folder).constData(),
                                            IN_CREATE | IN_CLOSE_WRITE | IN_DELETE | IN_MOVED_TO);
        EXPECT_GE(watch, 0);
    }
    ~FolderWatch() { close(m_queue); }
    FolderWatch(const FolderWatch &) = delete;
    FolderWatch &operator=(const FolderWatch &) = delete;

    QStringList events()
    {
        QStringList found;
        alignas(inotify_event) char buffer[65536];
        for (ssize_t size = 0; (size = read(m_queue, buffer, sizeof buffer)) > 0;) {
            for (ssize_t at = 0; at < size;) {
                const auto *event = reinterpret_cast<const inotify_event *>(buffer + at);
                found.append(nameOf(event->mask) + QString::fromUtf8(event->name));
                at += static_cast<ssize_t>(sizeof(inotify_event) + event->len);
            }
        }
        return found;
    }

private:
    static QString nameOf(quint32 mask)
    {
        if (mask & IN_CREATE)
            return QStringLiteral("create ");
        if (mask & IN_DELETE)
            return QStringLiteral("delete ");
        return mask & IN_MOVED_TO ? QStringLiteral("replace ") : QStringLiteral("write ");
    }

    int m_queue;
};

using VST3MarkerOrder = VST3ScanBench;

} // namespace

// The trace lies in the watched folder, so that calls, marker and catalogue are seen on one clock.
TEST_F(VST3MarkerOrder, StandsFromBeforeTheFirstCallUntilAfterTheLast)
{
    const QByteArray traced =
        "trace \"" + m_folder.path(QStringLiteral("Effects/calls")).toUtf8() + "\"\nclass A\n";
    addVST3File(m_folder.plugins(), QStringLiteral("Comp x64"), traced);
    m_folder.write(QStringLiteral("Effects/calls"), {});
    FolderWatch watch(m_folder.effects());
    scan();

    // Neighbouring events of one file come as one: all calls lie between marker written and marker deleted.
    EXPECT_EQ(m_folder.lines(QStringLiteral("Effects/calls")).constLast(),
              QStringLiteral("static-destructor"));
    EXPECT_EQ(watch.events().mid(0, 7),
              texts({"create Comp .scan3", "write Comp .scan3", "write calls", "delete Comp .scan3",
                     "create VST3Configuration.xml.tmp", "write VST3Configuration.xml.tmp",
                     "replace VST3Configuration.xml"}));
}
