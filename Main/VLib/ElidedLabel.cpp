#include "Main/VLib/ElidedLabel.h"

#include <QPainter>
#include <QStyle>

QSize ElidedLabel::minimumSizeHint() const { return {0, fontMetrics().height()}; }

void ElidedLabel::paintEvent(QPaintEvent *)
{
    QPainter painter(this);
    const QRect line = contentsRect();
    style()->drawItemText(&painter, line, Qt::AlignVCenter | Qt::TextSingleLine, palette(), isEnabled(),
                          fontMetrics().elidedText(text(), Qt::ElideMiddle, line.width()), foregroundRole());
}
