#pragma once

#include <QString>

#include <pluginterfaces/base/funknown.h>

// How a record's identifier spells the id of a class: 32 hexadecimal digits.

QString classIdText(const Steinberg::FUID &classId);

/// The class id that an identifier spells, in upper or lower case; an invalid one for any other text.
Steinberg::FUID classIdOf(const QString &identifier);
