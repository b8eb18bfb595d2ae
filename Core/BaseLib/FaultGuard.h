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
} // namespace FaultCode

/// A hardware fault that guarded code committed, as an ordinary exception: "SE Exception: " with "Access
/// Violation" or the code.
class SEException : public std::runtime_error {
public:
    explicit SEException(quint32 code);
    quint32 code() const { return m_code; }

private:
    quint32 m_code;
};

namespace FaultGuardDetail {
/// Calls `function(argument)`. A hardware fault in it on this thread ends the call and is thrown from here as
/// an `SEException`; C++ exceptions pass through.
void run(void (*function)(void *), void *argument);
} // namespace FaultGuardDetail

/// Calls a function of strangers with hardware faults turned into exceptions (`SEException`). Guards nest and
/// are per thread; outside a guard a fault ends the process as ever. Frames of the function itself are left
/// without unwinding, so what it calls in our own code must not hold locks or memory while it touches the
/// stranger's.
template <typename Function>
auto callGuarded(Function &&function) -> std::invoke_result_t<Function &>
{
    using Result = std::invoke_result_t<Function &>;
    using Callee = std::remove_reference_t<Function>;
    if constexpr (std::is_void_v<Result>) {
        FaultGuardDetail::run([](void *callee) { (*static_cast<Callee *>(callee))(); }, &function);
    } else {
        static_assert(std::is_trivially_destructible_v<Result>);
        struct Call {
            Callee *callee;
            Result result;
        } call{&function, {}};
        FaultGuardDetail::run(
            [](void *data) {
                auto *guarded = static_cast<Call *>(data);
                guarded->result = (*guarded->callee)();
            },
            &call);
        return call.result;
    }
}

/// The text of an exception that a stranger threw, whose own code gives it; empty when that code fails.
QString guardedText(const std::exception &exception);
