#include "Main/AudioEngineController/Effects/VST3/HostObjects/IVST3EditOwner.h"
#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostContext.h"
#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostMessage.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <tuple>
#include <utility>

using namespace Steinberg;
using Vst::IAttributeList;
using Vst::IMessage;

namespace {

using Text = std::basic_string<Vst::TChar>;

Text wide(const std::string &text) { return Text(text.begin(), text.end()); }

/// Accepts edits and adds up what they say.
struct AddingOwner : IVST3EditOwner {
    tresult editGesture(Vst::ParamID id, bool begun) noexcept override { return add(begun ? id : 10 * id); }
    tresult performEdit(Vst::ParamID, double value) noexcept override { return add(value); }
    tresult groupEdit(bool begun) noexcept override { return add(begun ? 100 : 1000); }
    tresult add(double part)
    {
        sum += part;
        return kResultOk;
    }
    double sum = 0;
};

/// How many of the five edits an owner hears of are refused.
int refusedEdits(VST3HostContext &context)
{
    return context.beginEdit(3) + context.performEdit(3, 0.75) + context.endEdit(3) +
           context.startGroupEdit() + context.finishGroupEdit();
}

/// What the getters find under a key, each with its type.
std::string under(IAttributeList &list, const char *id)
{
    int64 number = 0;
    double real = 0;
    Vst::TChar text[8] = {};
    const void *data = nullptr;
    uint32 size = 0;
    std::string found = list.getInt(id, number) == kResultOk ? "int " + std::to_string(number) : "";
    found += list.getFloat(id, real) == kResultOk ? "float " + std::to_string(real) : "";
    found += list.getString(id, text, 8) == kResultOk ? "text " + std::string(text, text + 4) : "";
    const bool isBlock = list.getBinary(id, data, size) == kResultOk;
    return found + (isBlock ? "block " + std::string(static_cast<const char *>(data), size) : "");
}

} // namespace

TEST(VST3HostContext, AnswersItsInterfacesInTheOrderOfItsTables)
{
    using namespace Vst;
    const FUID known[] = {IComponentHandler::iid,
                          IComponentHandler2::iid,
                          IComponentHandler3::iid,
                          IContextMenuTarget::iid,
                          IHostApplication::iid,
                          IUnitHandler::iid,
                          IComponentHandlerBusActivation::iid};
    const auto context = VST3HostContext::createOwned(nullptr);
    void *found = nullptr;
    for (std::size_t table = 0; table < std::size(known); ++table) {
        EXPECT_EQ(context->queryInterface(known[table], &found), kResultOk);
        EXPECT_EQ(found, reinterpret_cast<void **>(context.get()) + table);
        EXPECT_EQ(static_cast<FUnknown *>(found)->release(), 1u);
    }
    EXPECT_EQ(context->queryInterface(FUnknown::iid, &found), kResultOk);
    EXPECT_EQ(found, context.get());
    EXPECT_EQ(context->release(), 1u);
    EXPECT_EQ(context->queryInterface(IMessage::iid, &found), kNotImplemented);
    EXPECT_EQ(found, nullptr);
    EXPECT_EQ(context->queryInterface(nullptr, &found), kNotImplemented);
    EXPECT_EQ(context->queryInterface(FUnknown::iid, nullptr), kInvalidArgument);
    Text name(128, 'x');
    EXPECT_EQ(context->getName(name.data()), kResultOk);
    EXPECT_EQ(name, wide("Quillon") + TChar(0) + Text(120, 'x'));
    EXPECT_EQ(context->getName(nullptr), kInvalidArgument);
}

TEST(VST3HostContext, LendsOneListAndOutlivesEveryReleaseOfAPlugin)
{
    const auto context = VST3HostContext::createOwned(nullptr);
    void *list = nullptr, *again = nullptr;
    ASSERT_EQ(context->queryInterface(IAttributeList::iid, &list), kResultOk);
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(static_cast<IAttributeList *>(list)->release() + context->release(), 2u) << "both stay";
    EXPECT_EQ(context->queryInterface(IAttributeList::iid, &again), kResultOk);
    EXPECT_EQ(list, again);
    EXPECT_EQ(under(*static_cast<IAttributeList *>(list), "key"), "");
}

TEST(VST3HostContext, CreatesMessagesAndLists)
{
    const FUID message = IMessage::iid, list = IAttributeList::iid, host = Vst::IHostApplication::iid;
    const std::tuple<FUID, FUID, bool> rows[] = {{message, message, true}, {message, FUnknown::iid, true},
                                                 {list, list, true},       {message, list, false},
                                                 {list, host, false},      {host, host, false}};
    const auto context = VST3HostContext::createOwned(nullptr);
    for (const auto &[classId, interfaceId, isMade] : rows) {
        TUID cid, iid;
        classId.toTUID(cid);
        interfaceId.toTUID(iid);
        void *made = context.get();
        EXPECT_EQ(context->createInstance(cid, iid, &made), isMade ? kResultOk : kNoInterface);
        EXPECT_EQ(made ? static_cast<FUnknown *>(made)->release() : 9, isMade ? 0u : 9u);
        EXPECT_EQ(context->createInstance(cid, nullptr, &made), kNoInterface);
        EXPECT_EQ(context->createInstance(nullptr, iid, &made), kNoInterface);
        EXPECT_EQ(context->createInstance(cid, iid, nullptr), kInvalidArgument);
    }
}

TEST(VST3HostContext, PassesEditsToItsOwnerWhileThereIsOne)
{
    EXPECT_EQ(refusedEdits(*VST3HostContext::createOwned(nullptr)), 5);
    AddingOwner owner;
    auto context = VST3HostContext::createOwned(&owner);
    EXPECT_EQ(refusedEdits(*context), 0);
    EXPECT_EQ(owner.sum, 3 + 0.75 + 30 + 100 + 1000);
    EXPECT_EQ(context->restartComponent(-1), kResultFalse) << "what an owner leaves alone";
    EXPECT_EQ(context->createContextMenu(nullptr, nullptr), nullptr);
    VST3HostContext *kept = context.get();
    kept->addRef();
    context.reset();
    EXPECT_EQ(refusedEdits(*kept), 5) << "a plug-in keeps it";
    EXPECT_EQ(kept->release(), 0u);
}

TEST(VST3HostMessage, OwnsItsIdentifierAndLendsItsList)
{
    auto *const message = VST3HostMessage::createCounted();
    EXPECT_EQ(message->getMessageID(), nullptr);
    std::string id = "meter";
    message->setMessageID(id.c_str());
    id = "other";
    message->setMessageID(message->getMessageID() + 2);
    EXPECT_STREQ(message->getMessageID(), "ter") << "the new text may be a part of the old one";
    message->setMessageID(nullptr);
    EXPECT_EQ(message->getMessageID(), nullptr);
    IAttributeList *list = message->getAttributes();
    EXPECT_EQ(list->release(), 1u) << "the message's own reference cannot be given away";
    EXPECT_EQ(message->getAttributes(), list);
    list->addRef();
    message->release();
    EXPECT_EQ(list->setInt("key", 1), kResultOk);
    EXPECT_EQ(list->release(), 0u);
}

TEST(VST3HostAttributeList, KeepsACopyOfOneValueForAKey)
{
    using Setter = tresult (*)(IAttributeList &, const char *key);
    const std::pair<Setter, const char *> setters[] = {
        {[](auto &to, auto key) { return to.setInt(key, -7); }, "int -7"},
        {[](auto &to, auto key) { return to.setFloat(key, 0.125); }, "float 0.125000"},
        {[](auto &to, auto key) { return to.setString(key, wide("text").c_str()); }, "text text"},
        {[](auto &to, auto key) { return to.setBinary(key, "block", 5); }, "block block"}};
    const auto list = VST3HostAttributeList::createOwned();
    for (const char *key : {"gain 2", "gain", "Gain", "", "\xFF\xFE"}) {
        EXPECT_EQ(under(*list, key), "") << "the keys before are others";
        for (const auto &first : setters)
            for (const auto &[set, found] : setters) {
                EXPECT_EQ(first.first(*list, key), kResultOk);
                EXPECT_EQ(set(*list, key), kResultOk);
                EXPECT_EQ(under(*list, key), found);
                EXPECT_EQ(set(*list, nullptr), kInvalidArgument);
            }
    }
    EXPECT_EQ(list->setString("gain", nullptr), kInvalidArgument);
    EXPECT_EQ(list->setBinary("gain", nullptr, 1), kInvalidArgument);
    EXPECT_EQ(under(*list, "gain"), "block block") << "as it was";
    const void *data = nullptr;
    uint32 size = 0;
    ASSERT_EQ(list->getBinary("gain", data, size), kResultOk);
    EXPECT_EQ(list->setBinary("gain", static_cast<const char *>(data) + 1, 2), kResultOk);
    EXPECT_EQ(under(*list, "gain"), "block lo") << "set from a part of itself";
    EXPECT_EQ(list->setString("key", wide("abc").c_str()), kResultOk);
    for (const uint32 units : {4u, 3u, 2u, 0u, ~0u}) { // without a terminator where it does not fit
        Text buffer(8, 'x');
        EXPECT_EQ(list->getString("key", buffer.data(), units), kResultOk);
        const std::size_t copied = std::min(units, 4u);
        EXPECT_EQ(buffer, Text(wide("abc").c_str(), copied) + Text(8 - copied, 'x')) << units;
    }
    EXPECT_EQ(list->getString("key", nullptr, 4), kInvalidArgument);
}
