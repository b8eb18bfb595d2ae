#include "Main/ReWire/ReWireSystem.h"

std::unique_ptr<ReWireSystem> installedReWireSystem()
{
    return nullptr; // ReWire was never published for these systems.
}
