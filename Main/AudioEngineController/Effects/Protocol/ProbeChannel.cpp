#include "Main/AudioEngineController/Effects/Protocol/ProbeChannel.h"

#include <QDataStream>
#include <QtEndian>

#include <set>

namespace {

using Kind = ChannelMessage::Kind;

constexpr int kSizeBytes = 4;
/// Longest text in UTF-16 units. Names are far shorter; a plug-in that gives more is cut.
constexpr int kMaxText = 1 << 16;
constexpr quint32 kMaxLeftOut = 4096; ///< sub-plug-ins of a shell that are asked for at most

// Each message is spelt once, for a writer and for a reader of its fields.

class FieldWriter {
public:
    explicit FieldWriter(QDataStream &stream)
        : m_stream(stream)
    {}
    void text(const QString &text) { m_stream << text.left(kMaxText); }
    template <typename Number>
    void number(const Number &number)
    {
        m_stream << number;
    }
    template <typename Enum>
    void choice(const Enum &value, Enum /*last*/)
    {
        m_stream << static_cast<quint8>(value);
    }
    void numbers(const std::set<quint32> &values)
    {
        m_stream << static_cast<quint32>(values.size());
        for (const quint32 value : values)
            m_stream << value;
    }

private:
    QDataStream &m_stream;
};

class FieldReader {
public:
    explicit FieldReader(QDataStream &stream)
        : m_stream(stream)
    {}
    void text(QString &text)
    {
        m_stream >> text;
        if (text.size() > kMaxText)
            m_stream.setStatus(QDataStream::ReadCorruptData);
    }
    template <typename Number>
    void number(Number &number)
    {
        m_stream >> number;
    }
    template <typename Enum>
    void choice(Enum &value, Enum last)
    {
        quint8 read = 0;
        m_stream >> read;
        if (read > static_cast<quint8>(last))
            m_stream.setStatus(QDataStream::ReadCorruptData);
        else
            value = static_cast<Enum>(read);
    }
    void numbers(std::set<quint32> &values)
    {
        quint32 count = 0;
        m_stream >> count;
        if (count > kMaxLeftOut)
            m_stream.setStatus(QDataStream::ReadCorruptData);
        for (quint32 index = 0; index < count && m_stream.status() == QDataStream::Ok; ++index) {
            quint32 value = 0;
            m_stream >> value;
            values.insert(value);
        }
    }

private:
    QDataStream &m_stream;
};

template <typename Visitor, typename Record>
void visitRecord(Visitor &fields, Record &record)
{
    for (auto *text : {&record.path, &record.fileTime, &record.name, &record.id, &record.vendor,
                       &record.version, &record.categories, &record.subName})
        fields.text(*text);
    for (auto *number : {&record.inputs, &record.outputs, &record.vstCategory, &record.behaviour,
                         &record.width, &record.latency})
        fields.number(*number);
    for (auto *number : {&record.category, &record.subId})
        fields.number(*number);
    for (auto *flag : {&record.enabled, &record.working, &record.favourite})
        fields.number(*flag);
}

template <typename Visitor, typename Outcome>
void visitOutcome(Visitor &fields, Outcome &outcome)
{
    fields.choice(outcome.status, ProbeStatus::Cancelled);
    fields.choice(outcome.stage, ProbeStage::Close);
    fields.choice(outcome.ifFailed, ProbeOutcome::IfFailed::LookAgain);
    fields.text(outcome.reason);
    fields.number(outcome.milliseconds);
    fields.number(outcome.leftThreads);
    fields.number(outcome.leftModule);
    fields.number(outcome.faulted);
}

template <typename Visitor, typename Message>
void visitMessage(Visitor &fields, Message &message)
{
    fields.choice(message.kind, Kind::Done);
    switch (message.kind) {
    case Kind::Job:
        fields.choice(message.job.format, PluginFormat::Last);
        fields.text(message.job.path);
        fields.text(message.job.fileTime);
        fields.numbers(message.job.leftOut);
        fields.number(message.job.announceClasses);
        break;
    case Kind::Stage:
        fields.choice(message.stage, ProbeStage::Close);
        break;
    case Kind::Class:
        fields.text(message.text);
        break;
    case Kind::Children:
        fields.number(message.number);
        break;
    case Kind::Child:
    case Kind::ChildCloses:
    case Kind::Record:
        visitRecord(fields, message.record);
        break;
    case Kind::ChildEnd:
        visitRecord(fields, message.record);
        visitOutcome(fields, message.outcome);
        break;
    case Kind::Done:
        visitOutcome(fields, message.outcome);
        break;
    case Kind::Ready:
    case Kind::Announced:
    case Kind::ChildClosed:
        break;
    }
}

} // namespace

QByteArray encodeMessage(const ChannelMessage &message)
{
    QByteArray bytes(kSizeBytes, '\0');
    QDataStream stream(&bytes, QIODevice::WriteOnly | QIODevice::Append);
    stream.setVersion(QDataStream::Qt_5_15);
    FieldWriter fields(stream);
    visitMessage(fields, message);
    qToLittleEndian(static_cast<quint32>(bytes.size() - kSizeBytes), bytes.data());
    return bytes;
}

std::optional<ChannelMessage> ChannelReader::next()
{
    if (m_isBroken || m_bytes.size() < kSizeBytes)
        return std::nullopt;
    const auto size = qFromLittleEndian<quint32>(m_bytes.constData());
    if (size == 0 || size > static_cast<quint32>(kMaxMessage)) {
        m_isBroken = true;
        return std::nullopt;
    }
    const int end = kSizeBytes + static_cast<int>(size);
    if (m_bytes.size() < end)
        return std::nullopt;
    QDataStream stream(m_bytes.mid(kSizeBytes, static_cast<int>(size)));
    stream.setVersion(QDataStream::Qt_5_15);
    ChannelMessage message;
    FieldReader fields(stream);
    visitMessage(fields, message);
    m_isBroken = stream.status() != QDataStream::Ok || !stream.atEnd();
    m_bytes.remove(0, end);
    return m_isBroken ? std::nullopt : std::make_optional(message);
}
