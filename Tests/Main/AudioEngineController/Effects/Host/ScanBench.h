#pragma once

#include "Tests/Support/ScanBench.h"
