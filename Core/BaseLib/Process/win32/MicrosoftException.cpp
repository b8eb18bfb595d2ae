#include "Core/BaseLib/Process/win32/MicrosoftException.h"

#include "Core/BaseLib/Process/FaultGuard.h"

#include <algorithm>
#include <cstring>

namespace {

// The tables that the compiler leaves with a thrown type; places are distances from the module's start. Each
// type lists itself first and then its bases.

struct ThrowInfo {
    quint32 attributes;
    qint32 destructor;
    qint32 forward;
    qint32 types;
};

struct TypeList {
    qint32 count;
    qint32 entries[1];
};

struct CatchableType {
    quint32 properties;
    qint32 descriptor;
    qint32 offsetInObject;
    qint32 virtualBaseTable;
    qint32 virtualBaseIndex;
};

struct TypeDescriptor {
    const void *table;
    void *spare;
    char name[1];
};

/// Of an exception record's parameters: magic number, object, throw information, module.
constexpr DWORD kParameters = 4;
constexpr char kStandardException[] = ".?AVexception@std@@";
/// More bases than any type has.
constexpr qint32 kMostTypes = 64;
/// Place of `what` in the table of virtual functions.
constexpr std::size_t kWhat = 1;

using What = const char *(*)(const void *object);

template <typename T>
const T *at(ULONG_PTR module, qint32 distance)
{
    return reinterpret_cast<const T *>(module + static_cast<ULONG_PTR>(static_cast<qint64>(distance)));
}

void copyText(const char *from, char *text, std::size_t size)
{
    const std::size_t length = from ? strnlen(from, size - 1) : 0;
    std::memcpy(text, from, length);
    text[length] = '\0';
}

void copyWhat(ULONG_PTR object, qint32 offset, char *text, std::size_t size)
{
    const void *exception = at<void>(object, offset);
    const What *functions = *static_cast<const What *const *>(exception);
    copyText(functions[kWhat](exception), text, size);
}

void read(const EXCEPTION_RECORD &record, char *text, std::size_t size)
{
    const ULONG_PTR object = record.ExceptionInformation[1];
    const ULONG_PTR module = record.ExceptionInformation[3];
    const auto *thrown = reinterpret_cast<const ThrowInfo *>(record.ExceptionInformation[2]);
    const auto *types = at<TypeList>(module, thrown->types);
    for (qint32 index = 0; index < std::min(types->count, kMostTypes); ++index) {
        const auto *type = at<CatchableType>(module, types->entries[index]);
        const char *name = at<TypeDescriptor>(module, type->descriptor)->name;
        if (index == 0)
            copyText(name, text, size);
        if (std::strcmp(name, kStandardException) == 0) {
            copyWhat(object, type->offsetInObject, text, size);
            return;
        }
    }
}

} // namespace

void MicrosoftException::describe(const EXCEPTION_RECORD &record, char *text, std::size_t size)
{
    copyText("a C++ exception of another compiler", text, size);
    if (record.NumberParameters < kParameters || record.ExceptionInformation[2] == 0)
        return;
    try {
        callGuarded([&] { read(record, text, size); });
    } catch (...) {
        // The text keeps what was copied so far.
    }
}
