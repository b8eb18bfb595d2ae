#include "Workstation/Options/OptionTexts.h"

#include <QFile>

#include <cstdio>

namespace {

bool write(const QString &name, const QString &text)
{
    QFile file(name);
    if (file.open(QIODevice::WriteOnly) && file.write(text.toUtf8()) >= 0 && file.flush())
        return true;
    std::fprintf(stderr, "cannot write %s: %s\n", qPrintable(name), qPrintable(file.errorString()));
    return false;
}

bool writeManual(const QString &templates, const QString &texts, const char *page)
{
    QFile manualTemplate(templates + QLatin1Char('/') + QLatin1String(page) + QLatin1String(".in"));
    if (manualTemplate.open(QIODevice::ReadOnly))
        return write(texts + QLatin1Char('/') + QLatin1String(page),
                     manualPage(QString::fromUtf8(manualTemplate.readAll())));
    std::fprintf(stderr, "cannot read %s: %s\n", qPrintable(manualTemplate.fileName()),
                 qPrintable(manualTemplate.errorString()));
    return false;
}

} // namespace

/// Run by the build: writes the completion and the manual pages, from the tables of options and usage.
int main(int argc, char **argv)
{
    if (argc != 3) {
        std::fputs("usage: write_texts FOLDER-OF-TEMPLATES FOLDER\n", stderr);
        return 2;
    }
    const QString templates = QString::fromLocal8Bit(argv[1]);
    const QString texts = QString::fromLocal8Bit(argv[2]);
    const bool isWritten = writeManual(templates, texts, "fxscan.1") &&
                           writeManual(templates, texts, "FxProbe.1") &&
                           write(texts + QLatin1String("/fxscan.bash"), bashCompletion());
    return isWritten ? 0 : 1;
}
