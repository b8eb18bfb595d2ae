#include "Main/ReWire/ReWireProbe.h"

int probeReWireVersion()
{
    return 1; // ReWire was never published for these systems, so none is installed.
}
