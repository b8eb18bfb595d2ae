#include "Tests/Fixtures/VST3/HostQuestions.h"

#include "Tests/Fixtures/VST3/ResultName.h"

#include <pluginterfaces/vst/ivstattributes.h>
#include <pluginterfaces/vst/ivsthostapplication.h>
#include <pluginterfaces/vst/ivstmessage.h>

#include <cstring>

using namespace Steinberg;

namespace {

/// Asks the context for its host application and hands that to `question`.
template <typename Question>
std::string askApplication(FUnknown *context, Question question)
{
    Vst::IHostApplication *application = nullptr;
    const tresult result =
        context->queryInterface(Vst::IHostApplication::iid, reinterpret_cast<void **>(&application));
    if (result != kResultOk || !application)
        return resultName(result) + " no host application";
    const std::string answer = question(*application);
    application->release();
    return answer;
}

std::string askName(FUnknown *context)
{
    return askApplication(context, [](Vst::IHostApplication &application) {
        Vst::String128 name = {};
        const tresult result = application.getName(name);
        std::string text = resultName(result) + " ";
        for (const char16 *unit = name; unit != name + 128 && *unit; ++unit)
            text += *unit < 0x80 ? static_cast<char>(*unit) : '?';
        return text;
    });
}

std::string storeInMessage(Vst::IMessage &message)
{
    message.setMessageID("fixture");
    Vst::IAttributeList *attributes = message.getAttributes();
    int64 value = 0;
    if (!attributes || attributes->setInt("value", 42) != kResultOk ||
        attributes->getInt("value", value) != kResultOk)
        return "no attributes";
    const FIDString id = message.getMessageID();
    return std::string(id ? id : "no id") + " " + std::to_string(value);
}

std::string askMessage(FUnknown *context)
{
    return askApplication(context, [](Vst::IHostApplication &application) {
        TUID id = {};
        std::memcpy(id, Vst::IMessage::iid.toTUID(), sizeof id);
        Vst::IMessage *message = nullptr;
        const tresult result = application.createInstance(id, id, reinterpret_cast<void **>(&message));
        if (result != kResultOk || !message)
            return resultName(result) + " no message";
        const std::string answer = resultName(result) + " " + storeInMessage(*message);
        message->release();
        return answer;
    });
}

/// Releases the list as smart pointers do, although the host hands it out without a reference, and asks
/// again.
std::string askAttributes(FUnknown *context)
{
    Vst::IAttributeList *first = nullptr;
    Vst::IAttributeList *second = nullptr;
    const tresult result =
        context->queryInterface(Vst::IAttributeList::iid, reinterpret_cast<void **>(&first));
    if (result != kResultOk || !first)
        return resultName(result) + " no list";
    first->setInt("value", 42);
    first->release();
    context->queryInterface(Vst::IAttributeList::iid, reinterpret_cast<void **>(&second));
    int64 value = 0;
    if (second)
        second->getInt("value", value);
    return resultName(result) + (first == second ? " same " : " another ") + std::to_string(value);
}

std::string askUnknown(FUnknown *context)
{
    const FUID unknown(0x01020304, 0x05060708, 0x090A0B0C, 0x0D0E0F10);
    void *object = &context;
    const tresult result = context->queryInterface(unknown.toTUID(), &object);
    return resultName(result) + (object ? " object" : " null");
}

const struct Question {
    const char *name;
    std::string (*ask)(FUnknown *context);
} kQuestions[] = {
    {"name", askName}, {"message", askMessage}, {"attributes", askAttributes}, {"unknown", askUnknown}};

const Question *findQuestion(const std::string &name)
{
    for (const Question &entry : kQuestions) {
        if (name == entry.name)
            return &entry;
    }
    return nullptr;
}

} // namespace

bool isHostQuestion(const std::string &question) { return findQuestion(question) != nullptr; }

std::string askHost(const std::string &question, FUnknown *context)
{
    return context ? findQuestion(question)->ask(context) : "no context";
}
