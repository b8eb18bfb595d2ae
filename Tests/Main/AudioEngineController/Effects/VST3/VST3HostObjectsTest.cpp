#include "Main/AudioEngineController/Effects/VST3/IVST3EditOwner.h"
#include "Main/AudioEngineController/Effects/VST3/VST3HostContext.h"
#include "Main/AudioEngineController/Effects/VST3/VST3HostMessage.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <limits>
#include <memory>
#include <string>
#include <thread>
#include <utility>
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

TEST(VST3HostContext, RefusesWhatItDoesNotKnowAndNullPointers)
{
    const auto context = listingContext();
    TUID message;
    IMessage::iid.toTUID(message);
    const FUID nobody;
    const char *const strangers[] = {Vst::IUnitHandler2::iid.toTUID(), message, nobody.toTUID(), nullptr};
    for (const char *iid : strangers) {
        void *found = context.get();
        EXPECT_EQ(context->queryInterface(iid, &found), kNotImplemented);
        EXPECT_EQ(found, nullptr);
    }
    for (const auto &[cid, iid] : {std::pair<char *, char *>(nullptr, message), {message, nullptr}}) {
        void *created = context.get();
        EXPECT_EQ(context->createInstance(cid, iid, &created), kNoInterface);
        EXPECT_EQ(created, nullptr);
    }
    EXPECT_EQ(context->queryInterface(FUnknown::iid, nullptr), kInvalidArgument);
    EXPECT_EQ(context->queryInterface(IAttributeList::iid, nullptr), kInvalidArgument);
    EXPECT_EQ(context->createInstance(message, message, nullptr), kInvalidArgument);
    EXPECT_EQ(countOf(*context->unknown()), 1u);
}

TEST(VST3HostContext, LendsOneListAndOutlivesEveryReleaseOfAPlugin)
{
    const auto context = listingContext();
    IAttributeList *list = attributesOf(*context);
    for (int i = 0; i < 5; ++i) {
        EXPECT_EQ(attributesOf(*context), list);
        list->release();
        context->release();
    }
    EXPECT_EQ(list->setInt("key", 7), kResultOk);
    EXPECT_EQ(countOf(*list), 1u);
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

TEST(VST3HostContext, PassesEditsToItsOwner)
{
    EXPECT_EQ(answersOf(*listingContext()), std::vector<tresult>(13, kResultFalse)) << "without one";
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

TEST(VST3HostMessage, LendsOneListAndLeavesItToAPluginThatHoldsIt)
{
    auto message = newMessage();
    IAttributeList *list = message->getAttributes();
    ASSERT_NE(list, nullptr);
    EXPECT_EQ(list->release(), 1u) << "the message's own reference cannot be given away";
    EXPECT_EQ(message->getAttributes(), list);
    list->addRef();
    const Counted<IAttributeList> held(list);
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

/// What the getters find under a key, each with its type.
std::string under(IAttributeList &list, const char *id)
{
    int64 number = 5;
    double real = 5;
    TChar text[8] = {};
    const void *data = nullptr;
    uint32 size = 0;
    std::string found;
    found += list.getInt(id, number) == kResultOk ? "int " + std::to_string(number) : "";
    found += list.getFloat(id, real) == kResultOk ? "float " + std::to_string(real) : "";
    found += list.getString(id, text, 8) == kResultOk
                 ? "text " + std::string(text, std::find(text, text + 8, 0))
                 : "";
    found += list.getBinary(id, data, size) == kResultOk
                 ? "block " + std::string(static_cast<const char *>(data), size)
                 : "";
    return found;
}

} // namespace

TEST(VST3HostAttributeList, ReplacesAValueByOneOfAnyType)
{
    const struct {
        tresult (*set)(IAttributeList &, const char *key);
        const char *found;
    } setters[] = {
        {[](IAttributeList &to, const char *key) {
             return to.setInt(key, std::numeric_limits<int64>::min());
         },
         "int -9223372036854775808"},
        {[](IAttributeList &to, const char *key) { return to.setFloat(key, 0.125); }, "float 0.125000"},
        {[](IAttributeList &to, const char *key) { return to.setString(key, wide("text").c_str()); },
         "text text"},
        {[](IAttributeList &to, const char *key) { return to.setBinary(key, "block", 5); }, "block block"},
    };
    const auto list = newList();
    for (const char *key : {"gain 2", "gain", "Gain", "", "\x80", "\xFF\xFE"}) {
        EXPECT_EQ(under(*list, key), "") << "the keys before are others";
        for (const auto &from : setters) {
            for (const auto &to : setters) {
                EXPECT_EQ(from.set(*list, key), kResultOk);
                EXPECT_EQ(to.set(*list, key), kResultOk);
                EXPECT_EQ(under(*list, key), to.found);
            }
            EXPECT_EQ(from.set(*list, nullptr), kInvalidArgument);
        }
    }
    EXPECT_EQ(list->setString("gain", wide("text").c_str()), kResultOk);
    EXPECT_EQ(list->setString("gain", nullptr), kInvalidArgument);
    EXPECT_EQ(list->setBinary("gain", nullptr, 1), kInvalidArgument);
    EXPECT_EQ(list->getString("gain", nullptr, 4), kInvalidArgument);
    EXPECT_EQ(under(*list, nullptr), "");
    EXPECT_EQ(under(*list, "gain"), "text text") << "as it was";
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
