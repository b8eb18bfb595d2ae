#include "Main/VLib/VSTProgress.h"

#include "Main/VLib/StatusHandover.h"

#include <algorithm>
#include <limits>
#include <utility>

namespace {

/// Progress displays have no identity of their own.
constexpr int kNoIdentifier = -1;

/// A sum that stays at the end of the range: some counts come from plug-ins.
int saturatedSum(int left, int right)
{
    using Limits = std::numeric_limits<int>;
    const qint64 sum = static_cast<qint64>(left) + right;
    return static_cast<int>(std::clamp<qint64>(sum, Limits::min(), Limits::max()));
}

} // namespace

VSTProgress::VSTProgress(std::shared_ptr<StatusHandover> status)
    : VProgressDisplay(kNoIdentifier)
    , m_status(std::move(status))
{}

void VSTProgress::begin(const QString &text, int value)
{
    m_status->setText(text);
    m_current = value;
}

// The bar keeps its last value: whoever watches it sees the next text at once anyway.
void VSTProgress::finish() { m_current = m_total; }

void VSTProgress::setValue(int value)
{
    m_current = value;
    m_status->setValue(m_current);
}

void VSTProgress::step(int delta) { setValue(saturatedSum(m_current, delta)); }

void VSTProgress::setRange(int total, const QString &text)
{
    m_total = total;
    m_status->setRange(0, total, text);
}

void VSTProgress::setText(const QString &text) { m_status->setText(text); }

bool VSTProgress::isCancelled() const { return m_status->isClosing(); }
