#pragma once

class QApplication;

/// The scanner from its command line to its exit code: no argument, the path of a scan list, or
/// "-rewire_version".
int runScanner(QApplication &application);
