#pragma once

/// The scanner program as a worker of another scanner: asks what it is told to ask, until the other end is
/// gone. Gives the exit code.
int runProbeWorker();
