#include "Tests/Fuzz/FuzzTarget.h"

#include "Core/BaseLib/Log/DebugLog.h"

#include <QDir>
#include <QFile>

#include <algorithm>
#include <stdexcept>
#include <string>

void require(bool holds, const char *rule)
{
    if (!holds)
        throw std::logic_error(std::string("broken: ") + rule);
}

FuzzFolder::FuzzFolder()
    : m_outside(QDir::currentPath())
{
    debugLogSettings().off = true;
    require(m_folder.isValid() && QDir::setCurrent(m_folder.path()) && QDir().mkdir("here"),
            "there is a folder for the files");
    writeFuzzFile("here/Comp.so", "module");
    writeFuzzFile("here/Comp.vst3", "module");
}

FuzzFolder::~FuzzFolder() { QDir::setCurrent(m_outside); }

void writeFuzzFile(const QString &name, const QByteArray &content)
{
    QFile file(name);
    require(file.open(QIODevice::WriteOnly) && file.write(content) == content.size(),
            "a file for the target can be written");
}

bool anyHolds(std::initializer_list<QString> texts, const char *characters)
{
    const QLatin1String wanted(characters);
    const auto holds = [&](const QString &text) {
        return std::any_of(text.begin(), text.end(), [&](QChar one) { return wanted.contains(one); });
    };
    return std::any_of(texts.begin(), texts.end(), holds);
}
