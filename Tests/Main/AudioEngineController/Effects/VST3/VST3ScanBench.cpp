#include "Tests/Main/AudioEngineController/Effects/VST3/VST3ScanBench.h"

#include <QFileInfo>

QString VST3ScanBench::modulePath(const QString &name) const
{
    return m_folder.plugins() + QLatin1Char('/') + name + QStringLiteral(".vst3");
}

QString VST3ScanBench::add(const QString &name, const QByteArray &script, VST3Fixture fixture) const
{
    const QByteArray label = QFileInfo(name).fileName().toUtf8();
    const QByteArray classes = script.isNull() ? "class \"" + label + "\"\n" : script;
    const QString path = addVST3File(m_folder.plugins(), name, traceStatement(name) + classes, fixture);
    dateFirst(path);
    return path;
}

void VST3ScanBench::update(const QString &name, const QByteArray &script) const
{
    dateLater(add(name, script));
}

QString VST3ScanBench::addRaw(const QString &name, const QByteArray &content) const
{
    const QString path = modulePath(name);
    m_folder.write(path, content);
    dateFirst(path);
    return path;
}
