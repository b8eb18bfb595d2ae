#include <stdlib.h>

int answer(void);
/* The call is there to need something of the C library. */
int answer(void) { return getenv("") ? 0 : 42; }
