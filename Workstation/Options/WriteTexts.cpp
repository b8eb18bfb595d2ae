#include "Workstation/Options/OptionTexts.h"

#include <QFile>

#include <cstdio>

namespace {

bool write(const char *name, const QString &text)
{
    QFile file(QString::fromLocal8Bit(name));
    if (file.open(QIODevice::WriteOnly) && file.write(text.toUtf8()) >= 0 && file.flush())
        return true;
    std::fprintf(stderr, "cannot write %s: %s\n", name, qPrintable(file.errorString()));
    return false;
}

} // namespace

/// Run by the build: writes the completion and the manual page, from the table of options.
int main(int argc, char **argv)
{
    if (argc != 4) {
        std::fputs("usage: write_texts MANUAL-TEMPLATE MANUAL COMPLETION\n", stderr);
        return 2;
    }
    QFile manualTemplate(QString::fromLocal8Bit(argv[1]));
    if (!manualTemplate.open(QIODevice::ReadOnly)) {
        std::fprintf(stderr, "cannot read %s: %s\n", argv[1], qPrintable(manualTemplate.errorString()));
        return 1;
    }
    const bool isWritten = write(argv[2], manualPage(QString::fromUtf8(manualTemplate.readAll()))) &&
                           write(argv[3], bashCompletion());
    return isWritten ? 0 : 1;
}
