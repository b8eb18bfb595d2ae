#pragma once

#include "Main/AudioEngineController/Effects/Plugin/ChannelBuffers.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTInterface.h"

#include <QByteArray>
#include <QRect>
#include <QString>

#include <atomic>
#include <memory>
#include <optional>

class IVSTEffectOwner;

/// The checking wrapper around a plug-in's `AEffect`: it alone holds the pointer and calls the dispatcher.
/// Every call is guarded: what the plug-in throws or faults ends in a log line and a neutral answer. Copies
/// stand for the same effect and share what is known of its faults.
class VSTEffect {
public:
    /// The fields that are read, as they stood when asked.
    struct Fields {
        VstInt32 magic;
        VstInt32 flags; ///< 32 bits of what the header describes as more
        VstInt32 numPrograms;
        VstInt32 numParams;
        VstInt32 numInputs;
        VstInt32 numOutputs;
        VstInt32 initialDelay;
        VstInt32 uniqueID;
    };

    VSTEffect() = default;
    /// `path` is the module's, for the log.
    explicit VSTEffect(AEffect *effect, const QString &path = QString())
        : m_plugin(effect)
        , m_path(path)
        , m_faulted(std::make_shared<std::atomic<bool>>(false))
    {}

    bool isHeld() const { return m_plugin != nullptr; }
    bool isSame(const VSTEffect &other) const { return m_plugin == other.m_plugin; }
    /// True when the pointer leads to an effect: to readable memory with the right magic.
    bool isEffect() const;
    /// Nothing when the memory cannot be read.
    std::optional<Fields> fields() const;
    /// Stores the owner in the effect, for the host callback to find; false when the memory cannot be written
    /// to.
    bool setOwner(IVSTEffectOwner *owner);

    /// Calls the dispatcher with index 0 and whatever is not given 0 or null; 0 when the call failed.
    VstIntPtr dispatch(VstInt32 opcode);
    VstIntPtr dispatch(VstInt32 opcode, void *pointer);
    VstIntPtr dispatchValue(VstInt32 opcode, VstIntPtr value);
    VstIntPtr dispatchFloat(VstInt32 opcode, float number);
    /// The same in use: nothing is sent to an effect that faulted. Whether it may be called after that.
    bool send(VstInt32 opcode);
    bool sendValue(VstInt32 opcode, VstIntPtr value);
    /// Calls the dispatcher with an index and everything else; nothing when the call failed.
    std::optional<VstIntPtr> dispatchAt(VstInt32 opcode, VstInt32 index, VstIntPtr value, void *pointer);

    /// Dispatches an opcode that has a text written, into a buffer of `size` bytes. The text is cut at the
    /// buffer.
    struct Text {
        VstIntPtr answer;
        QByteArray bytes;
    };
    Text dispatchText(VstInt32 opcode, int size);
    /// The text of an opcode with an index, whatever the answer; empty when the call failed.
    QByteArray textAt(VstInt32 opcode, VstInt32 index, int size);
    /// The bytes of a `VstParameterProperties`; null when the plug-in gives none.
    QByteArray parameterProperties(VstInt32 index);

    /// A parameter's value; nothing when the plug-in has no such function or the call failed.
    std::optional<float> parameter(VstInt32 index);
    bool setParameter(VstInt32 index, float value);
    /// Processes a block of at most the buffers' size. False when the plug-in has no function for it, states
    /// more channels than the buffers have, or the call failed.
    bool process(ChannelBuffers &buffers, VstInt32 frames);
    /// The editor's place and size in pixels; nothing when the plug-in names none.
    std::optional<QRect> editorRect();
    /// The state of the current program as the plug-in keeps it, copied. The answer is the plug-in's: bytes,
    /// or 0 when the call failed; the data is null when there is none or it cannot be read as far as the
    /// answer says.
    struct Chunk {
        VstIntPtr answer = 0;
        QByteArray data;
    };
    Chunk programChunk();

    /// True once a call committed a hardware fault: the plug-in's state is unknown then.
    bool hasFaulted() const { return m_faulted && *m_faulted; }
    /// Whether an effect in use may still be called.
    bool isCallable() const { return isHeld() && !hasFaulted(); }

    /// Calls a plug-in back from inside the host callback, where whoever called the plug-in is the guard.
    static VstIntPtr dispatchUnguarded(AEffect *effect, VstInt32 opcode);

private:
    template <typename Call>
    bool guard(const char *what, int number, Call &&call);
    std::optional<VstIntPtr> call(VstInt32 opcode, VstInt32 index, VstIntPtr value, void *pointer,
                                  float number);

    AEffect *m_plugin = nullptr;
    QString m_path;
    std::shared_ptr<std::atomic<bool>> m_faulted; ///< set by whatever thread the plug-in was called on
};

/// Decides for guards that look at a fault before they handle it: logs the code and handles access violations
/// only; every other code is for the guards around.
bool vstExceptionFilter(quint32 code);
