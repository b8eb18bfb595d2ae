#pragma once

#include "Main/VLib/VObject.h"

#include <QString>

/// A progress bar with a line of text, as seen by a lengthy task. Called on the thread that does the work.
class VProgressDisplay : public VObject {
public:
    const char *className() const override { return "VProgressDisplay"; }

    /// Starts with a text and a value.
    virtual void begin(const QString &text, int value) = 0;
    /// The work is done: the value becomes the total.
    virtual void finish() = 0;
    virtual void setValue(int value) = 0;
    /// Adds to the value.
    virtual void step(int delta) = 0;
    /// The range is 0 to `total`; an empty text leaves the text shown as it is.
    virtual void setRange(int total, const QString &text) = 0;
    virtual void setText(const QString &text) = 0;
    /// True once the user asked for the work to stop.
    virtual bool isCancelled() const = 0;

protected:
    using VObject::VObject;
};
