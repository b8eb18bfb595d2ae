#pragma once

#include "Core/BaseLib/PluginLibrary.h"
#include "Main/AudioEngineController/Effects/EffectRecord.h"
#include "Main/AudioEngineController/Effects/VST/VSTEffect.h"

#include <QString>

#include <atomic>
#include <functional>
#include <memory>
#include <vector>

class VSTHost;

/// The function that a plug-in calls to talk to its host.
using VSTHostCallbackFunction = VstIntPtr (*)(AEffect *, VstInt32, VstInt32, VstIntPtr, void *, float);

/// A sub-plug-in that a shell names.
struct VSTSubPlugin {
    quint32 id;
    QString name;
};

/// The host's side of one VST 2 plug-in: its module, and the effect that the module's entry point handed out.
/// Loading, probing and destruction happen on one thread; what the host callback calls may come from any.
class VSTPlugin {
public:
    /// More sub-plug-ins than any shell has: an enumeration that goes on beyond is cut.
    static constexpr int kMaxSubPlugins = 4096;

    /// Gives an object that lives while the effect of a sub-plug-in is closed; null for an effect that needs
    /// none.
    using CloseBracket = std::function<std::shared_ptr<void>(VstInt32 shellId)>;

    explicit VSTPlugin(VSTHost &host);
    /// Releases the plug-in (`effClose` to every effect that the module handed out) and unloads its module.
    ~VSTPlugin();
    VSTPlugin(const VSTPlugin &) = delete;
    VSTPlugin &operator=(const VSTPlugin &) = delete;

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

    const QString &name() const { return m_name; }
    /// Name, colon and unique id: the identifier in the catalogue.
    const QString &key() const { return m_key; }
    /// The prefix of its format's identifiers.
    static QString identifierPrefix();
    /// Identifier of the sub-plug-in that this object stands for, as the plug-in sees it; 0: none.
    VstInt32 shellId() const { return m_shellId; }
    /// True when it was loaded to be probed only.
    bool isProbe() const { return m_isProbe; }

    /// What the host callback reports. None of these calls the plug-in.
    void setNeedsIdle() { m_needsIdle = true; }
    bool needsIdle() const { return m_needsIdle; }
    void setWantsMidi() { m_wantsMidi = true; }
    bool wantsMidi() const { return m_wantsMidi; }
    void setRealtime(bool realtime) { m_isRealtime = realtime; }
    bool isRealtime() const { return m_isRealtime; }
    void ioChanged() { m_ioChanged = true; }
    bool hasIoChanged() const { return m_ioChanged; }
    /// A plug-in being probed has no editor, and nobody listens to its parameters.
    bool resizeEditor(VstInt32 /*width*/, VstInt32 /*height*/) { return false; }
    void parameterChanged(VstInt32 /*index*/, float /*value*/) {}
    void parameterEdit(VstInt32 /*index*/, bool /*begins*/) {}
    void refreshDisplay() {}

private:
    /// An effect of the module, and the sub-plug-in it was made for (0: none).
    struct HandedOut {
        VSTEffect effect;
        VstInt32 shellId;
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
    int m_behaviour = 0;
    std::atomic<bool> m_needsIdle{false};
    std::atomic<bool> m_wantsMidi{false};
    std::atomic<bool> m_isRealtime{false};
    std::atomic<bool> m_ioChanged{false};
};
