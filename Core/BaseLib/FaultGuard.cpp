#include "Core/BaseLib/FaultGuard.h"

#include "Core/BaseLib/FormatText.h"

namespace {

std::string describe(quint32 code)
{
    if (code == FaultCode::kAccessViolation)
        return "SE Exception: Access Violation";
    return formatText(L"SE Exception: 0x%08X", code).toStdString();
}

} // namespace

SEException::SEException(quint32 code)
    : std::runtime_error(describe(code))
    , m_code(code)
{}
