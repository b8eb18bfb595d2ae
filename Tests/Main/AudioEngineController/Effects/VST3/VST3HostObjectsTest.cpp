#include "Main/AudioEngineController/Effects/VST3/IVST3EditOwner.h"
#include "Main/AudioEngineController/Effects/VST3/VST3HostContext.h"
#include "Main/AudioEngineController/Effects/VST3/VST3HostMessage.h"

#include <gtest/gtest.h>

#include <atomic>
#include <cstring>
#include <limits>
#include <memory>
#include <string>
#include <thread>
#include <vector>

using namespace Steinberg;
using Vst::IAttributeList;
using Vst::IMessage;
using Vst::TChar;

namespace {

using Text = std::basic_string<TChar>;

Text wide(const std::string &text) { return Text(text.begin(), text.end()); }

// Stands in the caller's variables, to show that they were left alone.
constexpr TChar kFiller = 0x2603;

template <typename Object>
struct CountedRelease {
    void operator()(Object *object) const { object->release(); }
};
/// Gives back the one reference that a plug-in holds; never takes one of its own, unlike the SDK's pointers.
template <typename Object>
using Counted = std::unique_ptr<Object, CountedRelease<Object>>;

Counted<VST3HostAttributeList> newList()
{
    return Counted<VST3HostAttributeList>(VST3HostAttributeList::createCounted());
}

Counted<VST3HostMessage> newMessage() { return Counted<VST3HostMessage>(VST3HostMessage::createCounted()); }

VST3Owned<VST3HostContext> listingContext() { return VST3HostContext::createOwned(nullptr); }

/// The references held now.
uint32 countOf(FUnknown &object)
{
    object.addRef();
    return object.release();
}

IAttributeList *attributesOf(VST3HostContext &context)
{
    void *list = nullptr;
    EXPECT_EQ(context.queryInterface(IAttributeList::iid, &list), kResultOk);
    return static_cast<IAttributeList *>(list);
}

tresult create(VST3HostContext &context, const FUID &cid, const FUID &iid, void **obj)
{
    TUID classId;
    TUID interfaceId;
    cid.toTUID(classId);
    iid.toTUID(interfaceId);
    return context.createInstance(classId, interfaceId, obj);
}

} // namespace

TEST(VST3HostContext, AnswersItsInterfacesInTheOrderOfItsTables)
{
    struct Case {
        const char *name;
        FUID iid;
        std::size_t table;
    };
    const Case cases[] = {
        {"unknown is the first table", FUnknown::iid, 0},
        {"component handler", Vst::IComponentHandler::iid, 0},
        {"component handler 2", Vst::IComponentHandler2::iid, 1},
        {"component handler 3", Vst::IComponentHandler3::iid, 2},
        {"context menu target", Vst::IContextMenuTarget::iid, 3},
        {"host application", Vst::IHostApplication::iid, 4},
        {"unit handler", Vst::IUnitHandler::iid, 5},
        {"bus activation", Vst::IComponentHandlerBusActivation::iid, 6},
    };
    const auto context = listingContext();
    for (const Case &row : cases) {
        SCOPED_TRACE(row.name);
        void *found = nullptr;
        ASSERT_EQ(context->queryInterface(row.iid, &found), kResultOk);
        EXPECT_EQ(static_cast<char *>(found),
                  reinterpret_cast<char *>(context.get()) + row.table * sizeof(void *));
        EXPECT_EQ(countOf(*context->unknown()), 2u);
        static_cast<FUnknown *>(found)->release();
    }
}

TEST(VST3HostContext, RefusesWhatItDoesNotKnow)
{
    const auto context = listingContext();
    const FUID strangers[] = {Vst::IUnitHandler2::iid, IMessage::iid, FUID()};
    for (const FUID &iid : strangers) {
        void *found = context.get();
        EXPECT_EQ(context->queryInterface(iid, &found), kNotImplemented);
        EXPECT_EQ(found, nullptr);
    }
    void *found = context.get();
    EXPECT_EQ(context->queryInterface(nullptr, &found), kNotImplemented);
    EXPECT_EQ(found, nullptr);
    EXPECT_EQ(context->queryInterface(FUnknown::iid, nullptr), kInvalidArgument);
    EXPECT_EQ(context->queryInterface(IAttributeList::iid, nullptr), kInvalidArgument);
    EXPECT_EQ(countOf(*context->unknown()), 1u);
}

TEST(VST3HostContext, ReadsIdentifiersAtAnyAddress)
{
    const auto context = listingContext();
    alignas(8) int8 bytes[1 + sizeof(TUID)];
    std::memcpy(bytes + 1, IAttributeList::iid.toTUID(), sizeof(TUID));
    void *found = nullptr;
    EXPECT_EQ(context->queryInterface(bytes + 1, &found), kResultOk);
    EXPECT_NE(found, nullptr);
}

TEST(VST3HostContext, LendsTheSameListEachTime)
{
    const auto context = listingContext();
    IAttributeList *list = attributesOf(*context);
    ASSERT_NE(list, nullptr);
    EXPECT_EQ(attributesOf(*context), list);
    EXPECT_EQ(countOf(*list), 1u);
    EXPECT_EQ(countOf(*context->unknown()), 1u);
}

TEST(VST3HostContext, OutlivesEveryReleaseOfAPlugin)
{
    const auto context = listingContext();
    for (int i = 0; i < 5; ++i) {
        attributesOf(*context)->release();
        context->release();
    }
    EXPECT_EQ(attributesOf(*context)->setInt("key", 7), kResultOk);
    EXPECT_EQ(countOf(*attributesOf(*context)), 1u);
    EXPECT_EQ(countOf(*context->unknown()), 1u);
}

TEST(VST3HostContext, WritesItsNameAndNothingBehindIt)
{
    Text name(128, kFiller);
    EXPECT_EQ(listingContext()->getName(name.data()), kResultOk);
    EXPECT_EQ(name, wide("Quillon") + TChar(0) + Text(120, kFiller));
    EXPECT_EQ(listingContext()->getName(nullptr), kInvalidArgument);
}

TEST(VST3HostContext, CreatesMessagesAndLists)
{
    struct Case {
        const char *name;
        FUID cid;
        FUID iid;
        tresult result;
    };
    const Case cases[] = {
        {"message", IMessage::iid, IMessage::iid, kResultOk},
        {"message as unknown", IMessage::iid, FUnknown::iid, kResultOk},
        {"list", IAttributeList::iid, IAttributeList::iid, kResultOk},
        {"message as list", IMessage::iid, IAttributeList::iid, kNoInterface},
        {"list as host application", IAttributeList::iid, Vst::IHostApplication::iid, kNoInterface},
        {"the host itself", Vst::IHostApplication::iid, Vst::IHostApplication::iid, kNoInterface},
        {"an unknown class", FUID(1, 2, 3, 4), IMessage::iid, kNoInterface},
    };
    const auto context = listingContext();
    for (const Case &row : cases) {
        SCOPED_TRACE(row.name);
        void *created = context.get();
        EXPECT_EQ(create(*context, row.cid, row.iid, &created), row.result);
        EXPECT_EQ(created != nullptr, row.result == kResultOk);
        if (created == nullptr)
            continue;
        const Counted<FUnknown> object(static_cast<FUnknown *>(created));
        EXPECT_EQ(countOf(*object), 1u);
    }
}

TEST(VST3HostContext, CreatesNothingFromNullPointers)
{
    const auto context = listingContext();
    TUID message;
    IMessage::iid.toTUID(message);
    EXPECT_EQ(context->createInstance(message, message, nullptr), kInvalidArgument);
    void *created = context.get();
    EXPECT_EQ(context->createInstance(nullptr, message, &created), kNoInterface);
    EXPECT_EQ(created, nullptr);
    created = context.get();
    EXPECT_EQ(context->createInstance(message, nullptr, &created), kNoInterface);
    EXPECT_EQ(created, nullptr);
}

namespace {

/// Writes down the edits that arrive, and accepts them.
class RecordingOwner : public IVST3EditOwner {
public:
    tresult editGesture(Vst::ParamID id, bool begun) noexcept override
    {
        return note({begun ? "begin" : "end", std::to_string(id)});
    }
    tresult performEdit(Vst::ParamID id, Vst::ParamValue value) noexcept override
    {
        return note({"edit", std::to_string(id), value > 0.5 ? "high" : "low"});
    }
    tresult groupEdit(bool begun) noexcept override { return note({begun ? "group" : "end of group"}); }

    std::vector<std::vector<std::string>> calls;

private:
    tresult note(std::vector<std::string> call)
    {
        calls.push_back(std::move(call));
        return kResultOk;
    }
};

/// What every operation that an owner could receive answers; a menu counts as accepted.
std::vector<tresult> answersOf(VST3HostContext &context)
{
    return {context.beginEdit(3),
            context.performEdit(3, 0.75),
            context.endEdit(3),
            context.startGroupEdit(),
            context.finishGroupEdit(),
            context.requestBusActivation(0, 1, 2, 1),
            context.restartComponent(-1),
            context.setDirty(1),
            context.requestOpenEditor(nullptr),
            context.executeMenuItem(-1),
            context.notifyUnitSelection(-1),
            context.notifyProgramListChange(-1, -1),
            context.createContextMenu(nullptr, nullptr) != nullptr ? kResultOk : kResultFalse};
}

} // namespace

TEST(VST3HostContext, WithoutOwnerAcceptsNoEdit)
{
    const auto context = listingContext();
    EXPECT_EQ(answersOf(*context), std::vector<tresult>(13, kResultFalse));
}

TEST(VST3HostContext, PassesEditsToItsOwner)
{
    RecordingOwner owner;
    const auto context = VST3HostContext::createOwned(&owner);
    std::vector<tresult> expected(5, kResultOk);
    expected.resize(13, kResultFalse);
    EXPECT_EQ(answersOf(*context), expected);
    const decltype(owner.calls) calls = {
        {"begin", "3"}, {"edit", "3", "high"}, {"end", "3"}, {"group"}, {"end of group"}};
    EXPECT_EQ(owner.calls, calls);
}

TEST(VST3HostContext, ForgetsItsOwnerWhenAPluginKeepsIt)
{
    RecordingOwner owner;
    auto context = VST3HostContext::createOwned(&owner);
    context->addRef();
    const Counted<VST3HostContext> kept(context.get());
    context.reset();
    EXPECT_EQ(kept->beginEdit(1), kResultFalse);
    EXPECT_TRUE(owner.calls.empty());
    EXPECT_EQ(countOf(*kept->unknown()), 1u);
}

TEST(VST3HostMessage, OwnsACopyOfItsIdentifier)
{
    const auto message = newMessage();
    EXPECT_EQ(message->getMessageID(), nullptr);
    std::string id = "meter";
    message->setMessageID(id.c_str());
    id = "other";
    EXPECT_STREQ(message->getMessageID(), "meter");
    message->setMessageID(message->getMessageID() + 2);
    EXPECT_STREQ(message->getMessageID(), "ter") << "the new text may be a part of the old one";
    message->setMessageID("");
    EXPECT_STREQ(message->getMessageID(), "");
    message->setMessageID(nullptr);
    EXPECT_EQ(message->getMessageID(), nullptr);
}

TEST(VST3HostMessage, LendsOneListWhateverAPluginReleases)
{
    const auto message = newMessage();
    IAttributeList *list = message->getAttributes();
    ASSERT_NE(list, nullptr);
    EXPECT_EQ(countOf(*list), 1u);
    EXPECT_EQ(list->setInt("key", 1), kResultOk);
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(list->release(), 1u) << "the message's own reference cannot be given away";
    EXPECT_EQ(message->getAttributes(), list);
    int64 value = 0;
    EXPECT_EQ(list->getInt("key", value), kResultOk);
    EXPECT_EQ(value, 1);
}

TEST(VST3HostMessage, LeavesItsListToAPluginThatHoldsIt)
{
    auto message = newMessage();
    message->getAttributes()->addRef();
    const Counted<IAttributeList> list(message->getAttributes());
    message.reset();
    EXPECT_EQ(list->setInt("key", 1), kResultOk);
    EXPECT_EQ(countOf(*list), 1u);
}

TEST(VST3HostReferences, AreCountedAcrossThreads)
{
    const auto list = newList();
    std::atomic<int> waiting(2);
    const auto useIt = [&] {
        --waiting;
        while (waiting > 0)
            std::this_thread::yield();
        for (int i = 0; i < 200000; ++i) {
            list->addRef();
            list->release();
        }
    };
    std::thread first(useIt);
    std::thread second(useIt);
    first.join();
    second.join();
    EXPECT_EQ(countOf(*list), 1u);
}

namespace {

/// Which types a getter finds under a key: i, f, s, b.
std::string typesUnder(IAttributeList &list, const char *id)
{
    int64 number = 0;
    double real = 0;
    TChar text[8] = {};
    const void *data = nullptr;
    uint32 size = 0;
    std::string types;
    types += list.getInt(id, number) == kResultOk ? "i" : "";
    types += list.getFloat(id, real) == kResultOk ? "f" : "";
    types += list.getString(id, text, 8) == kResultOk ? "s" : "";
    types += list.getBinary(id, data, size) == kResultOk ? "b" : "";
    return types;
}

} // namespace

TEST(VST3HostAttributeList, ReplacesAValueByOneOfAnyType)
{
    const auto list = newList();
    EXPECT_EQ(typesUnder(*list, "key"), "");
    const auto setters = {+[](IAttributeList &to) { to.setInt("key", 1); },
                          +[](IAttributeList &to) { to.setFloat("key", 1.5); },
                          +[](IAttributeList &to) { to.setString("key", wide("text").c_str()); },
                          +[](IAttributeList &to) { to.setBinary("key", "block", 5); }};
    const std::string types = "ifsb";
    for (auto from = setters.begin(); from != setters.end(); ++from) {
        for (auto to = setters.begin(); to != setters.end(); ++to) {
            (*from)(*list);
            (*to)(*list);
            EXPECT_EQ(typesUnder(*list, "key"), types.substr(std::size_t(to - setters.begin()), 1));
        }
    }
}

TEST(VST3HostAttributeList, GivesBackNumbersAsTheyWere)
{
    const auto list = newList();
    int64 number = 5;
    double real = 5;
    EXPECT_EQ(list->getInt("key", number), kResultFalse);
    EXPECT_EQ(number, 5);
    list->setInt("key", 1);
    list->setInt("key", std::numeric_limits<int64>::min());
    EXPECT_EQ(list->getFloat("key", real), kResultFalse);
    EXPECT_EQ(real, 5) << "a value of another type leaves the variable alone";
    EXPECT_EQ(list->getInt("key", number), kResultOk);
    EXPECT_EQ(number, std::numeric_limits<int64>::min());
    list->setFloat("key", 0.1);
    EXPECT_EQ(list->getFloat("key", real), kResultOk);
    EXPECT_EQ(real, 0.1);
}

TEST(VST3HostAttributeList, TellsKeysApartByTheirBytes)
{
    const auto list = newList();
    const std::vector<std::string> keys = {"gain 2", "gain", "Gain", "", "\x80", "\x7F", "gain ", "\xFF\xFE"};
    for (std::size_t i = 0; i < keys.size(); ++i)
        EXPECT_EQ(list->setInt(keys[i].c_str(), int64(i)), kResultOk);
    for (std::size_t i = 0; i < keys.size(); ++i) {
        int64 value = -1;
        EXPECT_EQ(list->getInt(keys[i].c_str(), value), kResultOk) << keys[i];
        EXPECT_EQ(value, int64(i)) << keys[i];
    }
    int64 value = -1;
    EXPECT_EQ(list->getInt("gai", value), kResultFalse);
}

TEST(VST3HostAttributeList, CopiesTextUpToTheSmallerSize)
{
    struct Case {
        const char *name;
        const char *stored;
        uint32 size;
        std::size_t copied; ///< units, the terminator counted
    };
    const Case cases[] = {
        {"room for more", "abc", 16, 4},
        {"room for all", "abc", 4, 4},
        {"no room for the terminator", "abc", 3, 3},
        {"room for a part", "abc", 2, 2},
        {"no room", "abc", 0, 0},
        {"a negative size", "abc", uint32(-1), 4},
        {"empty text", "", 16, 1},
    };
    const auto list = newList();
    for (const Case &row : cases) {
        SCOPED_TRACE(row.name);
        const Text stored = wide(row.stored);
        EXPECT_EQ(list->setString("key", stored.c_str()), kResultOk);
        Text buffer(16, kFiller);
        EXPECT_EQ(list->getString("key", buffer.data(), row.size), kResultOk);
        EXPECT_EQ(buffer, Text(stored.c_str(), row.copied) + Text(16 - row.copied, kFiller));
    }
}

TEST(VST3HostAttributeList, KeepsHugeText)
{
    const auto list = newList();
    const Text huge(3000000, kFiller);
    EXPECT_EQ(list->setString("key", huge.c_str()), kResultOk);
    Text buffer(huge.size() + 1, TChar('x'));
    EXPECT_EQ(list->getString("key", buffer.data(), uint32(buffer.size())), kResultOk);
    EXPECT_EQ(buffer, huge + TChar(0));
}

TEST(VST3HostAttributeList, OwnsItsBlocks)
{
    const auto list = newList();
    const std::string bytes("a\0b", 3);
    std::string source = bytes;
    EXPECT_EQ(list->setBinary("key", source.data(), 3), kResultOk);
    source = "xxx";
    const void *data = nullptr;
    uint32 size = 0;
    ASSERT_EQ(list->getBinary("key", data, size), kResultOk);
    EXPECT_EQ(std::string(static_cast<const char *>(data), size), bytes);

    EXPECT_EQ(list->setBinary("key", static_cast<const char *>(data) + 1, 2), kResultOk);
    ASSERT_EQ(list->getBinary("key", data, size), kResultOk);
    EXPECT_EQ(std::string(static_cast<const char *>(data), size), bytes.substr(1))
        << "a block may be set from a part of itself";

    EXPECT_EQ(list->setBinary("key", nullptr, 0), kResultOk);
    ASSERT_EQ(list->getBinary("key", data, size), kResultOk);
    EXPECT_EQ(size, 0u);
}

TEST(VST3HostAttributeList, RefusesNullPointersAndStaysAsItWas)
{
    const auto list = newList();
    list->setString("key", wide("text").c_str());
    EXPECT_EQ(list->setInt(nullptr, 1), kInvalidArgument);
    EXPECT_EQ(list->setString("key", nullptr), kInvalidArgument);
    EXPECT_EQ(list->setBinary("key", nullptr, 1), kInvalidArgument);
    EXPECT_EQ(list->getString("key", nullptr, 4), kInvalidArgument);
    EXPECT_EQ(typesUnder(*list, nullptr), "");
    EXPECT_EQ(typesUnder(*list, "key"), "s");
}
