#include "Tests/Support/ScanBench.cpp"
