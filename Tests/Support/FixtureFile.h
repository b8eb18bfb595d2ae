#pragma once

#include <QByteArray>
#include <QString>

/// Copies a module for tests to a path, replacing what is there, so that a test can also update a plug-in.
/// Its script goes beside it; a null script gives no script file. A failure fails the test.
void putFixture(const QString &source, const QString &path, const QByteArray &script);
