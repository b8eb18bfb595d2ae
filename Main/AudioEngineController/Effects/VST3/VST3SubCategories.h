#pragma once

#include <QString>

/// The category set, in its internal form, that a VST 3 class's sub-categories ("Fx|Reverb|Stereo") stand
/// for. Whole words between bars count; those that name no category of the browser are ignored.
quint32 categoryFromSubCategories(const QString &subCategories);

/// True when the set holds the category of instruments, which need no audio input.
bool isInstrumentCategory(quint32 category);
