#pragma once

#include "Core/BaseLib/Binary/PluginLibrary.h"
#include "Main/AudioEngineController/Effects/Catalogue/EffectRecord.h"
#include "Main/AudioEngineController/Effects/Plugin/AudioPlugin.h"
#include "Main/AudioEngineController/Effects/VST/VSTEffect.h"
#include "Main/AudioEngineController/Effects/VST/VSTSpeakers.h"

#include <QString>

#include <atomic>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <vector>

class VSTHost;
struct VSTStoredParameter;

/// The function that a plug-in calls to talk to its host.
using VSTHostCallbackFunction = VstIntPtr (*)(AEffect *, VstInt32, VstInt32, VstIntPtr, void *, float);

/// A sub-plug-in that a shell names.
struct VSTSubPlugin {
    quint32 id;
    QString name;
};

/// The host's side of one VST 2 plug-in: its module, and the effect that the module's entry point handed out.
/// Loading, probing and destruction happen on one thread; what the host callback calls may come from any.
/// Every call of the plug-in is guarded. One that committed a hardware fault is called no more, but for what
/// is left of a probe.
class VSTPlugin : public AudioPlugin {
public:
    /// More sub-plug-ins than any shell has: an enumeration that goes on beyond is cut.
    static constexpr int kMaxSubPlugins = 4096;

    /// Gives an object that lives while the effect of a sub-plug-in is closed; null for an effect that needs
    /// none.
    using CloseBracket = std::function<std::shared_ptr<void>(VstInt32 shellId)>;

    explicit VSTPlugin(VSTHost &host);
    /// Releases the plug-in (`effClose` to every effect that the module handed out) and unloads its module.
    ~VSTPlugin() override;

    /// Loads the plug-in for probing. False when the module does not load, its entry point fails or its
    /// effect is none; `isPluginModule` becomes false when the module has no entry point, true otherwise.
    bool load(const QString &path, VSTHostCallbackFunction callback, bool &isPluginModule);
    /// Loads a catalogued plug-in or a sub-plug-in of a shell; false, with log lines, when that fails. With
    /// reload mode 0 what was held is closed and unloaded before; with mode 1 the module stays and its entry
    /// point is called again.
    bool load(const EffectRecord &record, VSTHostCallbackFunction callback, int reloadMode);
    /// Reads what the catalogue holds of a plug-in: category, vendor, width, latency, name and identifier.
    void readInto(EffectRecord &record);
    /// Asks a shell for its sub-plug-ins, each identifier once.
    std::vector<VSTSubPlugin> subPlugins();

    void setCloseBracket(CloseBracket bracket) { m_closeBracket = std::move(bracket); }

    QString name() const override { return m_name; }
    /// Name, colon and unique id: the identifier in the catalogue.
    const QString &key() const { return m_key; }
    QString identifierPrefix() const override;
    QString formatIdentifier() const override { return m_key; }
    /// The key under which it was asked for, where that is an earlier one; presets may still carry it.
    void setRequestedKey(const QString &key) { m_requestedKey = key; }
    /// Identifier of the sub-plug-in that this object stands for, as the plug-in sees it; 0: none.
    VstInt32 shellId() const { return m_shellId; }
    /// True when it was loaded to be probed only.
    bool isProbe() const { return m_isProbe; }

    void close() override;
    /// Hands MIDI events over; false when the plug-in does not take any.
    bool processEvents(VstEvents &events);
    /// Announces how many samples will be processed in all, where that is known.
    void setTotalSamples(qint64 samples);

    /// Tells an open plug-in the speakers of its channels: those of the bus formats of as many channels as
    /// asked for, as far as they suit the channels that the plug-in states. Best before it is started.
    /// Nothing is sent while the plug-in knows and still has the channels that it stated last, unless
    /// `force` is set. True when the plug-in accepted; otherwise it keeps a layout of its own.
    bool UpdateSpeakerArrangement(int inputs, int outputs, bool force);

    /// 0 when the plug-in states a negative number.
    VstInt32 programCount() const;
    /// False for a program that is not there.
    bool setProgram(VstInt32 index);
    /// Of the current program.
    QString programName();

    /// The editor's place and size in pixels; nothing when the plug-in has none.
    std::optional<QRect> editorRect();
    /// Opens the editor in a window of the system; the window stays the caller's.
    bool openEditor(void *window);
    void closeEditor();
    /// To be called some ten times a second while the plug-in is in use.
    void idle();

    /// As stated, which may be any number.
    VstInt32 statedParameterCount() const;
    /// The name as the plug-in has it, else "Param" and the number counted from 1. One thread at a time.
    QString parameterName(VstInt32 index);

    bool StorePreset(PluginPreset &preset) override;
    bool LoadPreset(const PluginPreset &preset) override;

    /// What the host callback reports.
    void setNeedsIdle() { m_needsIdle = true; }
    bool needsIdle() const { return m_needsIdle; }
    void setWantsMidi() { m_wantsMidi = true; }
    bool wantsMidi() const { return m_wantsMidi; }
    void ioChanged();
    bool hasIoChanged() const { return m_ioChanged; }
    /// True when the editor is open and a listener gave it that size.
    bool resizeEditor(VstInt32 width, VstInt32 height);
    void parameterChanged(VstInt32 index, float value);
    void parameterEdit(VstInt32 index, bool begins);
    void refreshDisplay();

protected:
    bool openPlugin(const AudioSettings &settings) override;
    bool applySettings(const AudioSettings &settings) override;
    bool startProcessing() override;
    void stopProcessing() override;
    ChannelSetup readChannels() override;
    bool processBlock(ChannelBuffers &buffers, int frames) override
    {
        return isCallable() && m_effect.process(buffers, frames);
    }
    bool bypassPlugin(bool bypassed) override;

private:
    /// An effect of the module, and the sub-plug-in it was made for (0: none).
    struct HandedOut {
        VSTEffect effect;
        VstInt32 shellId;
    };

    /// Numbers of channels.
    struct Counts {
        VstInt32 inputs;
        VstInt32 outputs;

        bool operator!=(const Counts &other) const
        {
            return inputs != other.inputs || outputs != other.outputs;
        }
    };

    VSTEffect callEntryPoint(const QString &path, VSTHostCallbackFunction callback, bool &isPluginModule);
    AEffect *enter(void *entryPoint, VSTHostCallbackFunction callback);
    static bool isUsable(const VSTEffect &effect);
    bool adopt(const VSTEffect &effect, const QString &path);
    void nameFrom(const QString &path);
    bool asksForName();
    VstInt32 statedCategory();
    void closeEffects();
    void unload();
    /// Whether the plug-in may still be called.
    bool isCallable() const { return m_effect.isHeld() && !m_effect.hasFaulted(); }
    /// Dispatches to a plug-in that may still be called; whether it may be called after that.
    bool send(VstInt32 opcode);
    bool sendValue(VstInt32 opcode, VstIntPtr value);
    bool canDo(const char *capability);
    Counts statedCounts() const;
    /// The numbers of channels to tell the speakers of; nothing when the plug-in cannot be told any.
    std::optional<Counts> countsToTell(Counts requested, Counts stated) const;
    bool tellSpeakers(Counts counts);
    std::optional<bool> offer(VSTArrangementPair speakers);
    bool storeState(PluginPreset &preset);
    bool storeParameters(PluginPreset &preset);
    bool isLoadable(const PluginPreset &preset) const;
    bool loadState(const PluginPreset &preset);
    bool loadParameters(const PluginPreset &preset);
    bool setParameters(const std::vector<VSTStoredParameter> &stored,
                       std::map<QByteArray, std::deque<VstInt32>> &indexes);
    /// Nothing, with a log line, when the stated number cannot be.
    std::optional<VstInt32> parameterCount() const;

    VSTHost &m_host;
    PluginLibrary m_library;
    bool m_loaded = false;
    bool m_faulted = false; ///< a hardware fault was caught in this module: it is neither closed nor unloaded
    VSTEffect m_effect;
    std::vector<HandedOut> m_handedOut; ///< every effect of the module that was not closed yet, in order
    CloseBracket m_closeBracket;
    VSTEffect::Fields m_fields = {};
    std::atomic<VstInt32> m_shellId{0};
    bool m_isProbe = false;
    QString m_name;
    QString m_key;
    QString m_requestedKey; ///< empty: its own
    int m_behaviour = 0;
    std::atomic<bool> m_needsIdle{false};
    std::atomic<bool> m_wantsMidi{false};
    std::atomic<bool> m_ioChanged{false};
    std::atomic<bool> m_speakersPending{true}; ///< the plug-in at hand knows none, or its channels changed
    std::optional<Counts> m_toldCounts;        ///< what it stated when it was last told
    bool m_speakersAccepted = false;
    std::atomic<bool> m_editorOpen{false};
    bool m_effectOpened = false; ///< `effOpen` was sent to the effect at hand
    bool m_canBypass = false;
    bool m_takesMidi = false;
};
