#pragma once

#include <QString>

#include <stdexcept>
#include <type_traits>
#include <utility>

/// Codes of hardware faults; the numbers are those of Windows (ntstatus.h) on every platform.
namespace FaultCode {
inline constexpr quint32 kAccessViolation = 0xC0000005;
inline constexpr quint32 kIllegalInstruction = 0xC000001D;
inline constexpr quint32 kIntegerDivideByZero = 0xC0000094;
inline constexpr quint32 kStackOverflow = 0xC00000FD;

/// The fault in words, for example "invalid memory access"; empty for any other code.
QString name(quint32 code);
} // namespace FaultCode

/// A hardware fault in guarded code, as an ordinary exception: "SE Exception: " with "Access
/// Violation" or the code.
class SEException : public std::runtime_error {
public:
    /// `words` say what happened and where, as far as that is known (UTF-8).
    explicit SEException(quint32 code, const char *words = "");
    quint32 code() const { return m_code; }
    /// For people: "invalid memory access at 0x10 in Name.so+0x12A", or the name or number of the code.
    QString words() const;

private:
    quint32 m_code;
    QString m_words;
};

/// A C++ exception of another compiler's run-time library, which this program's `catch` does not see, as an
/// ordinary one: its own text, or its type. Only Windows has such compilers.
class ForeignException : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

namespace FaultGuardDetail {

/// What ends a guarded call and becomes an exception.
enum class Watch { FaultsAndForeignExceptions, ForeignExceptions };

/// Calls `function(argument)`. A watched event in it on this thread ends the call and is thrown from here as
/// an `SEException` or a `ForeignException`; C++ exceptions pass through.
void run(Watch watch, void (*function)(void *), void *argument);

template <typename Function>
auto call(Watch watch, Function &function) -> std::invoke_result_t<Function &>
{
    using Result = std::invoke_result_t<Function &>;
    if constexpr (std::is_void_v<Result>) {
        run(
            watch, [](void *callee) { (*static_cast<Function *>(callee))(); }, &function);
    } else {
        static_assert(std::is_trivially_destructible_v<Result>);
        struct Call {
            Function *callee;
            Result result;
        } call{&function, {}};
        run(
            watch,
            [](void *data) {
                auto *guarded = static_cast<Call *>(data);
                guarded->result = (*guarded->callee)();
            },
            &call);
        return call.result;
    }
}

} // namespace FaultGuardDetail

/// Calls foreign code. Hardware faults in it become exceptions (`SEException`), and so do the C++ exceptions
/// of other compilers (`ForeignException`). Guards nest and are per thread; outside a guard a fault ends the
/// process as usual. The function's own frames are left without unwinding, so code of ours in them must not
/// hold locks or memory while foreign code runs.
template <typename Function>
auto callGuarded(Function &&function) -> std::invoke_result_t<Function &>
{
    return FaultGuardDetail::call(FaultGuardDetail::Watch::FaultsAndForeignExceptions, function);
}

/// The same for the C++ exceptions of other compilers only: a fault ends the process as without a guard.
template <typename Function>
auto callTranslated(Function &&function) -> std::invoke_result_t<Function &>
{
    return FaultGuardDetail::call(FaultGuardDetail::Watch::ForeignExceptions, function);
}

/// The exception being handled, which foreign code threw, in words: "threw: …". Its `what` is foreign code,
/// too.
QString guardedThrownText();

/// The same as a sentence about what threw, without a guard.
QString thrownText();

/// Makes a call into a plug-in. What it throws, in words; empty when it threw nothing.
template <typename Call>
QString thrownBy(Call &&call)
{
    try {
        callTranslated(call);
    } catch (...) {
        return thrownText();
    }
    return QString();
}
