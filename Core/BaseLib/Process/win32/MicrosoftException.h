#pragma once

#include <cstddef>

#include <windows.h>

/// The C++ exceptions of Microsoft's compiler.
namespace MicrosoftException {

/// Under this code they travel through the system.
inline constexpr DWORD kCode = 0xE06D7363;

/// What an exception says of itself, while it is on its way and its object still exists: the text of a
/// `std::exception`, else the decorated name of its type, cut to `size - 1` bytes and terminated. The record
/// is foreign data: where it cannot be read, the text is a general one.
void describe(const EXCEPTION_RECORD &record, char *text, std::size_t size);

} // namespace MicrosoftException
