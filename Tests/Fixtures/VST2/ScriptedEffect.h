#pragma once

#include "Tests/Fixtures/VST2/PluginScript.h"
#include "Tests/Fixtures/VST2/RepeatingThread.h"

/// One effect that the module handed out. It stays in memory when it is closed, so that a call after that is
/// found out.
class ScriptedEffect {
public:
    ScriptedEffect(EffectScript script, FixtureSubject subject, audioMasterCallback host);
    ScriptedEffect(const ScriptedEffect &) = delete;
    ScriptedEffect &operator=(const ScriptedEffect &) = delete;

    AEffect *effect() { return &m_effect; }
    bool isClosed() const { return m_closed; }
    /// Makes the host calls that the script has for a stage.
    void askHost(const std::string &stage);
    /// Ends the effect's threads and spoils what the host must not read any more.
    void close();

private:
    static VstIntPtr dispatchTo(AEffect *effect, int opcode, int index, VstIntPtr value, void *pointer,
                                float opt);
    static void setParameterOf(AEffect *effect, int index, float value);
    static void processBlock(AEffect *effect, float **inputs, float **outputs, int frames);
    static float parameterOf(AEffect *effect, int index);
    static ScriptedEffect &open(AEffect *effect);

    void reach(const std::string &stage, const std::string &detail);
    VstIntPtr dispatch(int opcode, int index, VstIntPtr value, void *pointer, float opt);
    VstIntPtr handle(int opcode, int index, VstIntPtr value, void *pointer);
    VstIntPtr nextChild(void *pointer);
    VstIntPtr listChild(const ScriptedChild &child, void *pointer);
    VstIntPtr chunk(void *pointer) const;
    VstIntPtr editorRect(void *pointer);
    VstIntPtr properties(const ScriptedParameter &parameter, void *pointer) const;
    /// The parameter at an index, or null.
    ScriptedParameter *parameter(int index);

    void carryOut(const HostCall &call);
    void askFrom(const HostCall &call);
    void askAtDepth(const HostCall &call, int depth);
    VstIntPtr answerIdle();

    EffectScript m_script;
    FixtureSubject m_subject;
    audioMasterCallback m_host;
    AEffect m_effect = {};
    ERect m_editor = {};
    bool m_closed = false;
    std::size_t m_listed = 0; ///< children listed since the enumeration began
    std::vector<std::unique_ptr<RepeatingThread>> m_threads;
};
