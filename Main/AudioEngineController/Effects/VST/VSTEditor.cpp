#include "Main/AudioEngineController/Effects/VST/VSTEditor.h"

std::optional<QRect> VSTEditor::rect()
{
    const bool hasEditor = (m_effect.fields().value_or(VSTEffect::Fields{}).flags & effFlagsHasEditor) != 0;
    return hasEditor && m_effect.isCallable() ? m_effect.editorRect() : std::nullopt;
}

bool VSTEditor::open(void *window)
{
    if (m_isOpen || !rect())
        return false;
    m_effect.dispatch(effEditOpen, window);
    m_isOpen = m_effect.isCallable();
    return m_isOpen;
}

void VSTEditor::close()
{
    if (m_isOpen.exchange(false))
        m_effect.send(effEditClose);
}

void VSTEditor::idle()
{
    if (m_isOpen)
        m_effect.send(VstPublished::effEditIdle);
}
