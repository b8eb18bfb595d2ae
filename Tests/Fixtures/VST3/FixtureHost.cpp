// The smallest host: lists one module and prints what it was told, so that the modules for tests can be
// checked in a process that they may kill. Given a scan list instead, it plays a scanner that absorbs one
// crash marker per run.

#include "Core/BaseLib/PluginLibrary.h"
#include "Core/BaseLib/ProcessSetup.h"
#include "Core/BaseLib/ThreadCount.h"

#include <pluginterfaces/base/ipluginbase.h>
#include <pluginterfaces/vst/ivstcomponent.h>
#include <pluginterfaces/vst/ivsthostapplication.h>

#include <algorithm>
#include <cfenv>
#include <clocale>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <exception>
#include <filesystem>
#include <string>
#include <vector>

#include <sys/stat.h>

using namespace Steinberg;

namespace {

class HostContext final : public Vst::IHostApplication {
public:
    virtual ~HostContext() = default;
    tresult PLUGIN_API queryInterface(const TUID interfaceId, void **object) override
    {
        const bool known = FUnknownPrivate::iidEqual(interfaceId, Vst::IHostApplication::iid);
        *object = known ? this : nullptr;
        return known ? kResultOk : kNotImplemented;
    }
    uint32 PLUGIN_API addRef() override { return 1; }
    uint32 PLUGIN_API release() override { return 1; }
    tresult PLUGIN_API getName(Vst::String128 name) override
    {
        std::memcpy(name, u"Bench", sizeof u"Bench");
        return kResultOk;
    }
    tresult PLUGIN_API createInstance(TUID, TUID, void **object) override
    {
        *object = nullptr;
        return kResultFalse;
    }
};

template <std::size_t Size>
std::string textOf(const char8 (&field)[Size])
{
    return std::string(field, strnlen(field, Size));
}

void say(const std::string &line)
{
    std::puts(line.c_str());
    std::fflush(stdout);
}

std::string busesOf(Vst::IComponent &component, Vst::BusDirection direction)
{
    const int32 count = component.getBusCount(Vst::kAudio, direction);
    std::string text = "[" + std::to_string(count) + "]";
    for (int32 index = 0; index < std::min<int32>(count, 8); ++index) {
        Vst::BusInfo bus = {};
        const tresult result = component.getBusInfo(Vst::kAudio, direction, index, bus);
        text += result == kResultOk
                    ? " " + std::to_string(bus.channelCount) + ":" + std::to_string(bus.busType)
                    : " none";
    }
    return text;
}

std::string probe(IPluginFactory &factory, const TUID id, FUnknown &context)
{
    Vst::IComponent *component = nullptr;
    const tresult created =
        factory.createInstance(id, Vst::IComponent::iid, reinterpret_cast<void **>(&component));
    if (created != kResultOk || !component)
        return created == kResultOk ? "null instance" : "no instance";
    if (component->initialize(&context) != kResultOk)
        return "not initialised";
    std::string text = "in " + busesOf(*component, Vst::kInput);
    text += ", out " + busesOf(*component, Vst::kOutput);
    component->terminate();
    component->release();
    return text;
}

std::string newerInfo(IPluginFactory &factory, int32 index)
{
    IPluginFactory2 *newer = nullptr;
    PClassInfo2 info;
    if (factory.queryInterface(IPluginFactory2::iid, reinterpret_cast<void **>(&newer)) != kResultOk)
        return "-";
    newer->getClassInfo2(index, &info);
    newer->release();
    return textOf(info.subCategories) + "|" + textOf(info.vendor);
}

void listClass(IPluginFactory &factory, int32 index, FUnknown &context)
{
    PClassInfo info;
    char8 digits[64] = {};
    if (factory.getClassInfo(index, &info) != kResultOk)
        return say("class: no information");
    FUID::fromTUID(info.cid).toString(digits);
    std::string text = textOf(info.category) + "|" + textOf(info.name) + "|" + digits;
    text += "|" + newerInfo(factory, index);
    text += ": " + probe(factory, info.cid, context);
    say("class: " + text);
}

void listClasses(FUnknown &provider)
{
    HostContext context;
    IPluginFactory *factory = nullptr;
    PFactoryInfo info;
    if (provider.queryInterface(IPluginFactory::iid, reinterpret_cast<void **>(&factory)) != kResultOk)
        return say("no IPluginFactory");
    factory->getFactoryInfo(&info);
    const int32 count = factory->countClasses();
    say("factory: " + textOf(info.vendor) + "|" + textOf(info.url) + "|" + textOf(info.email) + "|" +
        std::to_string(count));
    for (int32 index = 0; index < std::min<int32>(count, 8); ++index)
        listClass(*factory, index, context);
    factory->release();
}

void listModule(const PluginLibrary &library)
{
    const auto provide = reinterpret_cast<IPluginFactory *(*)()>(library.symbol("GetPluginFactory"));
    IPluginFactory *factory = provide ? provide() : nullptr;
    if (!factory)
        return say(provide ? "null factory" : "no GetPluginFactory");
    listClasses(*factory);
    factory->release();
}

void openModule(PluginLibrary &library)
{
    const auto entry = reinterpret_cast<bool (*)(void *)>(library.symbol("ModuleEntry"));
    const auto exit = reinterpret_cast<bool (*)()>(library.symbol("ModuleExit"));
    if (!entry || entry(&library))
        listModule(library);
    else
        say("entry refused");
    if (exit && !exit())
        say("exit refused");
}

/// What side effects change, as a text for each.
std::vector<std::string> processState()
{
    const mode_t mask = umask(0);
    umask(mask);
    struct sigaction termination = {};
    sigaction(SIGTERM, nullptr, &termination);
    return {"locale " + std::string(std::setlocale(LC_ALL, nullptr)),
            "umask " + std::to_string(mask),
            "folder " + std::filesystem::current_path().string(),
            "rounding " + std::to_string(std::fegetround()),
            std::string("signal ") + (termination.sa_handler == SIG_DFL ? "default" : "handled"),
            "threads " + std::to_string(runningThreads().size())};
}

void sayWhatChanged(const std::vector<std::string> &before)
{
    const std::vector<std::string> after = processState();
    for (std::size_t index = 0; index < after.size(); ++index) {
        if (after[index] != before[index])
            say("changed: " + after[index]);
    }
}

int runModule(const QString &path)
{
    const std::vector<std::string> before = processState();
    PluginLibrary library;
    if (!library.load(path)) {
        say("not loaded");
        return 1;
    }
    try {
        openModule(library);
    } catch (int number) {
        say("caught " + std::to_string(number));
    } catch (const std::exception &error) {
        say(std::string("caught ") + error.what());
    }
    sayWhatChanged(before);
    if (processState().back() == before.back())
        library.free();
    else
        library.leaveMapped();
    say("unloaded");
    return 0;
}

int absorbOneMarker(const std::filesystem::path &scanList)
{
    for (const auto &entry : std::filesystem::directory_iterator(scanList.parent_path())) {
        if (entry.path().extension() == ".scan3") {
            std::filesystem::remove(entry.path());
            return 0;
        }
    }
    return 0;
}

} // namespace

int main(int argc, char **argv)
{
    prepareProcess();
    const std::filesystem::path argument = argc > 1 ? argv[1] : "";
    if (argument.filename() == "FXScan.xml")
        return absorbOneMarker(argument);
    return runModule(QString::fromStdString(argument.string()));
}
