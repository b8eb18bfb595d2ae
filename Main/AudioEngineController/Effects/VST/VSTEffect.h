#pragma once

#include "Main/AudioEngineController/Effects/VST/VSTInterface.h"

#include <QByteArray>

#include <optional>

/// The checking wrapper around a plug-in's `AEffect`: it alone holds the pointer and calls the dispatcher.
/// Every call is guarded: what the plug-in throws or faults ends in a log line and a neutral answer. Scan
/// worker.
class VSTEffect {
public:
    /// The fields that are read, as they stood when asked.
    struct Fields {
        VstInt32 magic;
        VstInt32 flags; ///< 32 bits of what the header describes as more
        VstInt32 numParams;
        VstInt32 numInputs;
        VstInt32 numOutputs;
        VstInt32 initialDelay;
        VstInt32 uniqueID;
    };

    VSTEffect() = default;
    explicit VSTEffect(AEffect *effect)
        : m_plugin(effect)
    {}

    bool isHeld() const { return m_plugin != nullptr; }
    bool isSame(const VSTEffect &other) const { return m_plugin == other.m_plugin; }
    /// True when the pointer leads to an effect: to readable memory with the right magic.
    bool isEffect() const;
    /// Nothing when the memory cannot be read.
    std::optional<Fields> fields() const;
    /// Stores the host's own pointer in the effect, for the host callback to find.
    void setOwner(void *owner);

    /// Calls the dispatcher with index 0 and whatever is not given 0 or null; 0 when the call failed.
    VstIntPtr dispatch(VstInt32 opcode);
    VstIntPtr dispatch(VstInt32 opcode, void *pointer);
    VstIntPtr dispatchValue(VstInt32 opcode, VstIntPtr value);
    VstIntPtr dispatchFloat(VstInt32 opcode, float number);

    /// Dispatches an opcode that has a text written, into a buffer of `size` bytes. The text is cut at the
    /// buffer.
    struct Text {
        VstIntPtr answer;
        QByteArray bytes;
    };
    Text dispatchText(VstInt32 opcode, int size);

    /// True once a call committed a hardware fault: the plug-in's state is unknown then.
    bool hasFaulted() const { return m_faulted; }

    /// Calls a plug-in back from inside the host callback, where whoever called the plug-in is the guard.
    static VstIntPtr dispatchUnguarded(AEffect *effect, VstInt32 opcode);

private:
    VstIntPtr call(VstInt32 opcode, VstIntPtr value, void *pointer, float number);

    AEffect *m_plugin = nullptr;
    bool m_faulted = false;
};

/// Decides for guards that look at a fault before they handle it: logs the code and handles access violations
/// only; every other code is for the guards around.
bool vstExceptionFilter(quint32 code);
