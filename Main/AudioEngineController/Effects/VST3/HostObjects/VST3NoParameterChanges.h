#pragma once

#include "Main/AudioEngineController/Effects/VST3/HostObjects/VST3HostObject.h"

#include <pluginterfaces/vst/ivstparameterchanges.h>

/// A queue of a parameter's changes that takes any and keeps none.
class VST3DroppingQueue final : public VST3HostObject<VST3DroppingQueue, Steinberg::Vst::IParamValueQueue> {
public:
    explicit VST3DroppingQueue(VST3Holder holder) noexcept
        : VST3HostObject(holder)
    {}

    Steinberg::Vst::ParamID PLUGIN_API getParameterId() override { return Steinberg::Vst::kNoParamId; }
    Steinberg::int32 PLUGIN_API getPointCount() override { return 0; }
    Steinberg::tresult PLUGIN_API getPoint(Steinberg::int32, Steinberg::int32 &,
                                           Steinberg::Vst::ParamValue &) override
    {
        return Steinberg::kResultFalse;
    }
    Steinberg::tresult PLUGIN_API addPoint(Steinberg::int32, Steinberg::Vst::ParamValue,
                                           Steinberg::int32 &index) override
    {
        index = 0;
        return Steinberg::kResultOk;
    }

private:
    friend VST3HostObject;

    ~VST3DroppingQueue() = default;
};

/// The parameter changes of a block in which nothing is automated. Plug-ins insist on such a list and on its
/// queues, also for what they report themselves (meters); that is dropped.
class VST3NoParameterChanges final
    : public VST3HostObject<VST3NoParameterChanges, Steinberg::Vst::IParameterChanges> {
public:
    /// Throws std::bad_alloc.
    explicit VST3NoParameterChanges(VST3Holder holder)
        : VST3HostObject(holder)
        , m_queue(VST3DroppingQueue::createOwned())
    {}

    Steinberg::int32 PLUGIN_API getParameterCount() override { return 0; }
    Steinberg::Vst::IParamValueQueue *PLUGIN_API getParameterData(Steinberg::int32) override
    {
        return nullptr;
    }
    Steinberg::Vst::IParamValueQueue *PLUGIN_API addParameterData(const Steinberg::Vst::ParamID &,
                                                                  Steinberg::int32 &index) override
    {
        index = 0;
        return m_queue.get();
    }

private:
    friend VST3HostObject;

    ~VST3NoParameterChanges() = default;

    VST3Owned<VST3DroppingQueue> m_queue;
};
