#pragma once

#include <cstddef>

#include <windows.h>

/// What a fault was and where it came up, for whoever contains it. Needs little of the stack.
void describeFault(const EXCEPTION_RECORD &record, const CONTEXT &context, char *words, std::size_t size);
