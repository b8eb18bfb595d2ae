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

/// The references held now.
uint32 countOf(FUnknown &object)
{
    object.addRef();
    return object.release();
}

} // namespace

TEST(VST3HostContext, AnswersItsInterfacesInTheOrderOfItsTables)
{
    const struct {
        FUID iid;
        int table; ///< -1: it has no such interface
    } rows[] = {{FUnknown::iid, 0},
                {Vst::IComponentHandler::iid, 0},
                {Vst::IComponentHandler2::iid, 1},
                {Vst::IComponentHandler3::iid, 2},
                {Vst::IContextMenuTarget::iid, 3},
                {Vst::IHostApplication::iid, 4},
                {Vst::IUnitHandler::iid, 5},
                {Vst::IComponentHandlerBusActivation::iid, 6},
                {Vst::IUnitHandler2::iid, -1},
                {IMessage::iid, -1},
                {FUID(), -1}};
    const auto context = VST3HostContext::createOwned(nullptr);
    for (const auto &row : rows) {
        SCOPED_TRACE(&row - rows);
        void *found = context.get();
        EXPECT_EQ(context->queryInterface(row.iid, &found), row.table < 0 ? kNotImplemented : kResultOk);
        auto *const tables = reinterpret_cast<void **>(context.get());
        EXPECT_EQ(found, row.table < 0 ? nullptr : static_cast<void *>(tables + row.table));
        EXPECT_EQ(countOf(*context->unknown()), found ? 2u : 1u);
        if (found)
            static_cast<FUnknown *>(found)->release();
    }
    void *found = context.get();
    EXPECT_EQ(context->queryInterface(nullptr, &found), kNotImplemented);
    EXPECT_EQ(found, nullptr);
    EXPECT_EQ(context->queryInterface(FUnknown::iid, nullptr), kInvalidArgument);
    EXPECT_EQ(context->queryInterface(IAttributeList::iid, nullptr), kInvalidArgument);
}

TEST(VST3HostContext, LendsOneListAndOutlivesEveryReleaseOfAPlugin)
{
    const auto context = VST3HostContext::createOwned(nullptr);
    void *first = nullptr;
    for (int i = 0; i < 5; ++i) {
        void *list = nullptr;
        ASSERT_EQ(context->queryInterface(IAttributeList::iid, &list), kResultOk);
        EXPECT_EQ(list, first ? first : list);
        first = list;
        static_cast<IAttributeList *>(list)->release();
        context->release();
    }
    auto &list = *static_cast<IAttributeList *>(first);
    EXPECT_EQ(list.setInt("key", 7), kResultOk);
    EXPECT_EQ(countOf(list), 1u);
    EXPECT_EQ(countOf(*context->unknown()), 1u);
}

TEST(VST3HostContext, WritesItsNameAndNothingBehindIt)
{
    const auto context = VST3HostContext::createOwned(nullptr);
    Text name(128, kFiller);
    EXPECT_EQ(context->getName(name.data()), kResultOk);
    EXPECT_EQ(name, wide("Quillon") + TChar(0) + Text(120, kFiller));
    EXPECT_EQ(context->getName(nullptr), kInvalidArgument);
}

TEST(VST3HostContext, CreatesMessagesAndLists)
{
    const FUID message = IMessage::iid, list = IAttributeList::iid, host = Vst::IHostApplication::iid;
    const struct {
        const char *name;
        FUID cid, iid;
        bool isMade;
    } rows[] = {{"message", message, message, true},
                {"message as unknown", message, FUnknown::iid, true},
                {"list", list, list, true},
                {"message as list", message, list, false},
                {"list as host application", list, host, false},
                {"the host itself", host, host, false}};
    const auto context = VST3HostContext::createOwned(nullptr);
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        TUID cid, iid;
        row.cid.toTUID(cid);
        row.iid.toTUID(iid);
        void *created = context.get();
        EXPECT_EQ(context->createInstance(cid, iid, &created), row.isMade ? kResultOk : kNoInterface);
        const Counted<FUnknown> object(static_cast<FUnknown *>(created));
        EXPECT_EQ(object ? countOf(*object) : 0, row.isMade ? 1u : 0u);
        EXPECT_EQ(context->createInstance(cid, nullptr, &created), kNoInterface);
        EXPECT_EQ(context->createInstance(nullptr, iid, &created), kNoInterface);
        EXPECT_EQ(created, nullptr);
        EXPECT_EQ(context->createInstance(cid, iid, nullptr), kInvalidArgument);
    }
}

namespace {

/// Writes down the edits that arrive, and accepts them.
class RecordingOwner : public IVST3EditOwner {
public:
    tresult editGesture(Vst::ParamID id, bool begun) noexcept override
    {
        return note((begun ? "begin " : "end ") + std::to_string(id));
    }
    tresult performEdit(Vst::ParamID id, Vst::ParamValue value) noexcept override
    {
        return note("edit " + std::to_string(id) + ' ' + std::to_string(value));
    }
    tresult groupEdit(bool begun) noexcept override { return note(begun ? "group" : "end of group"); }

    std::vector<std::string> calls;

private:
    tresult note(std::string call)
    {
        calls.push_back(std::move(call));
        return kResultOk;
    }
};

/// What the operations answer, those of an owner first; a menu counts as accepted.
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

TEST(VST3HostContext, PassesEditsToItsOwnerWhileThereIsOne)
{
    EXPECT_EQ(answersOf(*VST3HostContext::createOwned(nullptr)), std::vector<tresult>(13, kResultFalse));
    RecordingOwner owner;
    auto context = VST3HostContext::createOwned(&owner);
    EXPECT_EQ(answersOf(*context), (std::vector<tresult>{0, 0, 0, 0, 0, 1, 1, 1, 1, 1, 1, 1, 1}));
    const std::vector<std::string> calls = {"begin 3", "edit 3 0.750000", "end 3", "group", "end of group"};
    EXPECT_EQ(owner.calls, calls);

    context->addRef();
    const Counted<VST3HostContext> kept(context.get());
    context.reset();
    EXPECT_EQ(answersOf(*kept), std::vector<tresult>(13, kResultFalse)) << "a plug-in keeps it";
    EXPECT_EQ(owner.calls, calls);
    EXPECT_EQ(countOf(*kept->unknown()), 1u);
}

TEST(VST3HostMessage, OwnsItsIdentifierAndLendsItsList)
{
    Counted<VST3HostMessage> message(VST3HostMessage::createCounted());
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
        for (--waiting; waiting > 0;)
            std::this_thread::yield();
        for (int i = 0; i < 200000; ++i) {
            list->addRef();
            list->release();
        }
    };
    std::thread other(useIt);
    useIt();
    other.join();
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
    if (list.getInt(id, number) == kResultOk)
        found += "int " + std::to_string(number);
    if (list.getFloat(id, real) == kResultOk)
        found += "float " + std::to_string(real);
    if (list.getString(id, text, 8) == kResultOk)
        found += "text " + std::string(text, std::find(text, text + 8, 0));
    if (list.getBinary(id, data, size) == kResultOk)
        found += "block " + std::string(static_cast<const char *>(data), size);
    return found;
}

} // namespace

TEST(VST3HostAttributeList, ReplacesAValueByOneOfAnyType)
{
    using Setter = tresult (*)(IAttributeList &, const char *key);
    const std::pair<Setter, const char *> setters[] = {
        {[](auto &to, auto key) { return to.setInt(key, std::numeric_limits<int64>::min()); },
         "int -9223372036854775808"},
        {[](auto &to, auto key) { return to.setFloat(key, 0.125); }, "float 0.125000"},
        {[](auto &to, auto key) { return to.setString(key, wide("text").c_str()); }, "text text"},
        {[](auto &to, auto key) { return to.setBinary(key, "block", 5); }, "block block"}};
    const auto list = newList();
    for (const char *key : {"gain 2", "gain", "Gain", "", "\x80", "\xFF\xFE"}) {
        EXPECT_EQ(under(*list, key), "") << "the keys before are others";
        for (const auto &[first, before] : setters) {
            for (const auto &[second, found] : setters) {
                EXPECT_EQ(first(*list, key), kResultOk);
                EXPECT_EQ(under(*list, key), before);
                EXPECT_EQ(second(*list, key), kResultOk);
                EXPECT_EQ(under(*list, key), found);
            }
            EXPECT_EQ(first(*list, nullptr), kInvalidArgument);
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
    const struct {
        const char *name;
        const char *stored;
        uint32 size;
        std::size_t copied; ///< units, the terminator counted
    } rows[] = {{"room for more", "abc", 16, 4},
                {"room for all", "abc", 4, 4},
                {"no room for the zero", "abc", 3, 3},
                {"room for a part", "abc", 2, 2},
                {"no room", "abc", 0, 0},
                {"a negative size", "abc", uint32(-1), 4},
                {"empty text", "", 16, 1}};
    const auto list = newList();
    for (const auto &row : rows) {
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
    std::string source("a\0b", 3);
    EXPECT_EQ(list->setBinary("key", source.data(), 3), kResultOk);
    source = "xxx";
    EXPECT_EQ(under(*list, "key"), std::string("block a\0b", 9));
    const void *data = nullptr;
    uint32 size = 0;
    ASSERT_EQ(list->getBinary("key", data, size), kResultOk);
    EXPECT_EQ(list->setBinary("key", static_cast<const char *>(data) + 1, 2), kResultOk);
    EXPECT_EQ(under(*list, "key"), std::string("block \0b", 8)) << "set from a part of itself";
    EXPECT_EQ(list->setBinary("key", nullptr, 0), kResultOk);
    EXPECT_EQ(under(*list, "key"), "block ");
}
