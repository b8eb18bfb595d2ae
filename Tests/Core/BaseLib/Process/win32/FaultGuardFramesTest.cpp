#include "Tests/Core/BaseLib/Process/GuardedOutcome.h"
#include "Tests/Fixtures/FixturePlatform.h"

#include <array>
#include <thread>

#include <windows.h>

#include <gtest/gtest.h>

namespace {

constexpr DWORD64 kRepairable = 8; // no address of anybody
constexpr DWORD kMicrosoftCode = 0xE06D7363;
bool g_wasUnwound = false;
DWORD g_written = 0;
void (*volatile g_inner)() = nullptr;

} // namespace

extern "C" {

/// Calls `g_inner` from a frame whose handler is foreignFrameHandler, as a plug-in's own frame would be.
void callFromForeignFrame();

/// Lets writeToBeRepaired write elsewhere, leaves the rest to others; notes that its frame was unwound.
[[gnu::used]] EXCEPTION_DISPOSITION foreignFrameHandler(EXCEPTION_RECORD *record, void *, CONTEXT *context,
                                                        void *)
{
    if (record->ExceptionCode == EXCEPTION_ACCESS_VIOLATION && context->Rax == kRepairable) {
        context->Rax = reinterpret_cast<DWORD64>(&g_written);
        return ExceptionContinueExecution;
    }
    g_wasUnwound |= (record->ExceptionFlags & EXCEPTION_UNWINDING) != 0;
    return ExceptionContinueSearch;
}
}

asm(R"(
        .text
        .globl  callFromForeignFrame
        .seh_proc callFromForeignFrame
callFromForeignFrame:
        subq    $40, %rsp
        .seh_stackalloc 40
        .seh_endprologue
        .seh_handler foreignFrameHandler, @except, @unwind
        call    *g_innerCall(%rip)
        nop
        addq    $40, %rsp
        ret
        .seh_endproc
)");

extern "C" {
void runInner() { g_inner(); }
[[gnu::used]] void (*g_innerCall)() = runInner;
}

namespace {

std::string outcomeInForeignFrame(void (*inner)())
{
    g_inner = inner;
    g_wasUnwound = false;
    return outcome(callFromForeignFrame);
}

/// The tables that Microsoft's compiler leaves with a thrown std::runtime_error; places are distances from
/// the structure itself.
struct ThrownType {
    qint32 throwInfo[4] = {0, 0, 0, offset(&ThrownType::types)};
    qint32 types[3] = {2, offset(&ThrownType::derived), offset(&ThrownType::base)};
    qint32 derived[5] = {0, offset(&ThrownType::derivedName), 0, -1, 0};
    qint32 base[5] = {0, offset(&ThrownType::baseName), 8, -1, 0};
    struct Name {
        void *table = nullptr;
        void *spare = nullptr;
        char text[32] = {};
    } derivedName{nullptr, nullptr, ".?AVruntime_error@std@@"},
        baseName{nullptr, nullptr, ".?AVexception@std@@"};

    template <typename Member>
    static qint32 offset(Member ThrownType::*member)
    {
        alignas(ThrownType) static std::array<char, sizeof(ThrownType)> place;
        auto *type = reinterpret_cast<ThrownType *>(place.data());
        return static_cast<qint32>(reinterpret_cast<char *>(&(type->*member)) - place.data());
    }
};

const char *licenceText(const void *) { return "no licence"; }
const char *faultyText(const void *) { return *g_nowhere ? "" : nullptr; }

/// A thrown object, whose base `std::exception` lies behind 8 bytes of its own.
struct ThrownObject {
    void *own = nullptr;
    const void *const *functions = nullptr;
};

void throwAsMicrosoft(const char *(*what)(const void *))
{
    ThrownType type;
    const void *functions[] = {nullptr, reinterpret_cast<const void *>(what)};
    ThrownObject object;
    object.functions = functions;
    const ULONG_PTR parameters[] = {0x19930520, reinterpret_cast<ULONG_PTR>(&object),
                                    reinterpret_cast<ULONG_PTR>(&type), reinterpret_cast<ULONG_PTR>(&type)};
    RaiseException(kMicrosoftCode, EXCEPTION_NONCONTINUABLE, 4, parameters);
}

void writeToBeRepaired()
{
    DWORD64 address = kRepairable;
    asm volatile("movl $1, (%%rax)" : "+a"(address) : : "memory");
}

} // namespace

TEST(FaultGuardFrames, OfPluginsComeFirstAndAreUnwoundForExceptionsOnly)
{
    const struct {
        const char *name;
        void (*inner)();
        const char *outcome;
        bool unwinds;
    } rows[] = {
        {"violation that the plug-in repairs", writeToBeRepaired, "returned", false},
        {"violation that it leaves alone", writeNowhere, "SE Exception: Access Violation", false},
        {"exception of this compiler", [] { throw std::runtime_error("x"); }, "exception x", true},
        {"std::runtime_error of Microsoft's compiler", [] { throwAsMicrosoft(licenceText); },
         "foreign no licence", true},
        {"one whose text cannot be read", [] { throwAsMicrosoft(faultyText); },
         "foreign .?AVruntime_error@std@@", true},
        {"one without tables", [] { RaiseException(kMicrosoftCode, 0, 0, nullptr); },
         "foreign a C++ exception of another compiler", true},
        {"exception of another language", [] { RaiseException(0x0EEDFADE, 0, 0, nullptr); },
         "SE Exception: 0x0EEDFADE", false},
        {"stack overflow", [] { overflowStack(0); }, kOverflowOutcome, false},
    };
    for (int round = 0; round < 3; ++round) {
        for (const auto &row : rows) {
            EXPECT_EQ(outcomeInForeignFrame(row.inner), row.outcome) << row.name << ", round " << round;
            EXPECT_EQ(g_wasUnwound, row.unwinds) << row.name << ", round " << round;
        }
    }
}

TEST(FaultGuardFrames, ATranslatedCallCatchesForeignExceptionsAlone)
{
    EXPECT_THROW(callTranslated([] { RaiseException(kMicrosoftCode, 0, 0, nullptr); }), ForeignException);
    EXPECT_EQ(outcome([] { callTranslated([] { RaiseException(0xC0000123, 0, 0, nullptr); }); }),
              "SE Exception: 0xC0000123");
}
