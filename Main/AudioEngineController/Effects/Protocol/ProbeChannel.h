#pragma once

#include "Main/AudioEngineController/Effects/Protocol/Probe.h"

#include <QByteArray>

#include <optional>

/// What scanner and worker tell each other while plug-ins are asked in processes of their own.
struct ChannelMessage {
    enum class Kind : quint8 {
        Ready,       ///< worker: it is there and has no job
        Job,         ///< scanner: `job`
        Stage,       ///< worker: `stage` is entered
        Class,       ///< worker: the class `text` is asked next
        Announced,   ///< worker: a class that is to be announced was dealt with
        Children,    ///< worker: the shell has `number` sub-plug-ins
        Child,       ///< worker: the sub-plug-in `record` is loaded next
        ChildEnd,    ///< worker: what came of it: `outcome` and `record`
        ChildCloses, ///< worker: the sub-plug-in `record` is closed
        ChildClosed, ///< worker: it has been
        Record,      ///< worker: `record` is listed
        Done,        ///< worker: the job's `outcome`, without its records, which came before
    };

    Kind kind = Kind::Ready;
    ProbeJob job;
    ProbeStage stage = ProbeStage::Load;
    QString text;
    quint32 number = 0;
    EffectRecord record;
    ProbeOutcome outcome;
};

/// The argument with which the scanner program is a worker of another scanner.
inline constexpr char kProbeWorkerArgument[] = "-probe_worker";
/// The exit code of a worker whose channel is gone; any that plug-ins hardly take: abort() takes 3 on
/// Windows.
inline constexpr int kChannelLost = 213;

/// A message as it goes through a channel: its size in four bytes, the lowest first, and its content.
QByteArray encodeMessage(const ChannelMessage &message);

/// Takes messages out of the bytes that come through a channel. Whatever a plug-in wrote into it is checked:
/// after the first thing that is not a message nothing comes any more.
class ChannelReader {
public:
    /// More than any message has: texts are cut before they are sent.
    static constexpr int kMaxMessage = 1 << 20;

    void feed(const QByteArray &bytes) { m_bytes += bytes; }
    /// The next whole message; nothing when there is none yet.
    std::optional<ChannelMessage> next();
    /// True once something came that is not a message.
    bool isBroken() const { return m_isBroken; }

private:
    QByteArray m_bytes;
    bool m_isBroken = false;
};
