#pragma once

#include "Main/AudioEngineController/Effects/VST/Interface/VSTEffect.h"

#include <atomic>

/// The editor of a plug-in in use.
class VSTEditor {
public:
    /// The effect belongs to the plug-in's object, which outlives this one.
    explicit VSTEditor(VSTEffect &effect)
        : m_effect(effect)
    {}

    /// Its place and size in pixels; nothing when the plug-in has none.
    std::optional<QRect> rect();
    /// Opens it in a window of the system, which stays the caller's. False when it is open already, or the
    /// plug-in has none.
    bool open(void *window);
    void close();
    /// Any thread.
    bool isOpen() const { return m_isOpen; }
    /// Has an open editor draw itself.
    void idle();

private:
    VSTEffect &m_effect;
    std::atomic<bool> m_isOpen{false};
};
