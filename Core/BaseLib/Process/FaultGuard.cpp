#include "Core/BaseLib/Process/FaultGuard.h"

#include "Core/BaseLib/Log/FormatText.h"

#include <array>
#include <cstring>

namespace {

std::string describe(quint32 code)
{
    if (code == FaultCode::kAccessViolation)
        return "SE Exception: Access Violation";
    return formatText(L"SE Exception: 0x%08X", code).toStdString();
}

} // namespace

QString FaultCode::name(quint32 code)
{
    switch (code) {
    case kAccessViolation:
        return QStringLiteral("invalid memory access");
    case kIllegalInstruction:
        return QStringLiteral("illegal instruction");
    case kIntegerDivideByZero:
        return QStringLiteral("division by zero");
    case kStackOverflow:
        return QStringLiteral("stack overflow");
    default:
        return QString();
    }
}

SEException::SEException(quint32 code, const char *words)
    : std::runtime_error(describe(code))
    , m_code(code)
    , m_words(QString::fromUtf8(words))
{}

QString SEException::words() const
{
    if (!m_words.isEmpty())
        return m_words;
    const QString name = FaultCode::name(m_code);
    return name.isEmpty() ? formatText(L"fault 0x%08X", m_code) : name;
}

QString guardedText(const std::exception &exception)
{
    std::array<char, 512> text = {};
    try {
        callGuarded([&] {
            if (const char *what = exception.what())
                std::strncpy(text.data(), what, text.size() - 1);
        });
    } catch (...) {
        return QString();
    }
    return QString::fromUtf8(text.data());
}

QString thrownText()
{
    try {
        throw;
    } catch (const std::exception &error) {
        return QLatin1String("it threw: ") + QString::fromUtf8(error.what());
    } catch (...) {
        return QStringLiteral("it threw something other than a standard exception");
    }
}
