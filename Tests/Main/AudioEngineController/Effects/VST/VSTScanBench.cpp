#include "Tests/Main/AudioEngineController/Effects/VST/VSTScanBench.h"

#include "Tests/Support/VST3Fixture.h"

QString VSTScanBench::modulePath(const QString &name) const
{
    return m_folder.plugins() + QLatin1Char('/') + name + vst2Ending();
}

QString VSTScanBench::add(const QString &name, const QByteArray &script, VST2Fixture fixture) const
{
    const QString path = addVST2File(m_folder.plugins(), name, traceStatement(name) + script, fixture);
    dateFirst(path);
    return path;
}

void VSTScanBench::update(const QString &name, const QByteArray &script) const
{
    dateLater(add(name, script));
}

QString VSTScanBench::addRaw(const QString &name, const QByteArray &content) const
{
    const QString path = modulePath(name);
    m_folder.write(path, content);
    dateFirst(path);
    return path;
}

void VSTScanBench::addVST3(const QString &name, const QByteArray &script) const
{
    dateFirst(addVST3File(m_folder.plugins(), name, traceStatement(name) + "class Class\n" + script));
}
