#pragma once

/// From now on, what Qt warns of on this thread, the application's, is a trace line of the log in place of a
/// line on standard error: nobody who scans can mend it. Call before the application object is made, which
/// warns already.
void traceQtWarnings();
