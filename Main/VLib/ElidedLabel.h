#pragma once

#include <QLabel>

/// A line of text that is shortened in its middle where it is wider than the label: the beginning and the end
/// of a long name tell most. `text` stays whole.
class ElidedLabel final : public QLabel {
public:
    using QLabel::QLabel;

    /// One line, however narrow.
    QSize minimumSizeHint() const override;

protected:
    void paintEvent(QPaintEvent *event) override;
};
