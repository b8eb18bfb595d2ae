#pragma once

/// A place in the sources, named by its path inside the source tree.
struct SourcePlace {
    const char *file;
    int line;
};

/// Reports a failed assertion in the debug log. The program goes on.
void reportAssertion(const char *condition, SourcePlace place);

/// True when the condition holds; otherwise reports it and gives false, so that the caller can go on without
/// it.
#define FXPROBE_VERIFY(condition)                                                                            \
    ((condition) ? true : (reportAssertion(#condition, SourcePlace{__FILE__, __LINE__}), false))
