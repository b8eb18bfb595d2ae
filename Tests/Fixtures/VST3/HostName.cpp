#include "Tests/Fixtures/VST3/HostName.h"

#include <pluginterfaces/vst/ivsthostapplication.h>

using namespace Steinberg;

std::string hostName(FUnknown *context)
{
    Vst::IHostApplication *application = nullptr;
    if (!context || context->queryInterface(Vst::IHostApplication::iid,
                                            reinterpret_cast<void **>(&application)) != kResultOk)
        return "no host application";
    Vst::String128 name = {};
    const tresult result = application->getName(name);
    application->release();
    std::string text;
    for (const char16 *unit = name; unit != name + 128 && *unit; ++unit)
        text += *unit < 0x80 ? static_cast<char>(*unit) : '?';
    return result == kResultOk ? text : "no name";
}
