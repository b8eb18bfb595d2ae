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

constexpr char kThrewOther[] = "threw something other than a standard exception";

QString threw(const QString &what)
{
    return what.isEmpty() ? QStringLiteral("threw an exception without a text")
                          : QLatin1String("threw: ") + what;
}

/// The text of an exception; empty where there is none, or asking for it fails.
QString guardedWhat(const std::exception &exception)
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

QString guardedThrownText()
{
    try {
        throw;
    } catch (const std::exception &exception) {
        return threw(guardedWhat(exception));
    } catch (...) {
        return QLatin1String(kThrewOther);
    }
}

QString thrownText()
{
    try {
        throw;
    } catch (const std::exception &error) {
        const char *const what = error.what();
        return QLatin1String("it ") + threw(what ? QString::fromUtf8(what) : QString());
    } catch (...) {
        return QLatin1String("it ") + QLatin1String(kThrewOther);
    }
}
