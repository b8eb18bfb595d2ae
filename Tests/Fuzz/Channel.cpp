#include "Main/AudioEngineController/Effects/Protocol/ProbeChannel.h"
#include "Tests/Fuzz/FuzzTarget.h"

void fuzzChannel(const QByteArray &input)
{
    ChannelReader whole, inPieces;
    whole.feed(input);
    for (const char byte : input)
        inPieces.feed(QByteArray(1, byte));
    while (const std::optional<ChannelMessage> message = whole.next()) {
        const std::optional<ChannelMessage> piece = inPieces.next();
        const QByteArray bytes = encodeMessage(*message);
        require(piece && encodeMessage(*piece) == bytes, "a message says the same, however it came");
        ChannelReader again;
        again.feed(bytes);
        const std::optional<ChannelMessage> same = again.next();
        require(same && encodeMessage(*same) == bytes, "what was read is written and read again the same");
    }
    require(!inPieces.next() && whole.isBroken() == inPieces.isBroken(), "nothing comes after the last one");
}
