#include "Core/BaseLib/Process/CrashReport.h"

#include "Core/BaseLib/Process/CrashText.h"

CrashReport CrashReport::take(QString &printed)
{
    CrashReport report;
    QStringList others;
    for (const QString &line : printed.split(QLatin1Char('\n'))) {
        if (line.startsWith(QLatin1Char(CrashText::kFirst)))
            report.summary = line.mid(1); // a second one knows more
        else if (!line.startsWith(QLatin1Char(CrashText::kOther)))
            others.append(line);
        else if (report.frames.size() < static_cast<int>(kMaxCrashFrames))
            report.frames.append(line.mid(1));
    }
    printed = others.join(QLatin1Char('\n')).trimmed();
    return report;
}
