#pragma once

#include <QStringList>

/// The texts of a descriptor's list of features, which a null ends; none for null. A bar in one becomes "/":
/// with bars between them they stay apart, and are no longer than the longest text of a plug-in
/// (`kMaxClapText`); those behind are left out.
QStringList clapFeatures(const char *const *features);

/// The category set, in its internal form, that features ("instrument", "reverb") stand for. Those that name
/// no category of the browser are ignored.
quint32 categoryFromFeatures(const QStringList &features);
