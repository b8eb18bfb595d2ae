#include "Workstation/Options/OptionTexts.h"

#include "Main/AudioEngineController/Effects/Protocol/ScannerUsage.h"
#include "Workstation/Options/OptionTable.h"

namespace {

QString dashed(const OptionRow &row) { return QLatin1String("--") + QLatin1String(row.name); }

/// What the shell runs to offer values.
QString completionCommand(const OptionRow &row)
{
    if (const auto *target = std::get_if<ChoiceTarget>(&row.target)) {
        QStringList words;
        for (const char *choice : target->choices)
            words += QLatin1String(choice);
        return QStringLiteral("mapfile -t COMPREPLY < <(compgen -W '%1' -- \"$current\")")
            .arg(words.join(QLatin1Char(' ')));
    }
    if (const auto *target = std::get_if<WordsTarget>(&row.target))
        return QStringLiteral("mapfile -t COMPREPLY < <(compgen -W '%1' -- \"$current\")")
            .arg(target->words().join(QLatin1Char(' ')));
    const QLatin1String valueName(row.valueName);
    if (valueName == QLatin1String("folder"))
        return QStringLiteral("_fxscan_files -d");
    if (valueName == QLatin1String("file") || valueName == QLatin1String("path"))
        return QStringLiteral("_fxscan_files -f");
    return QStringLiteral(":");
}

/// Plain text for troff: dashes stay dashes, and no line begins with a character that troff takes for a
/// request.
QString escaped(QString escaped)
{
    escaped.replace(QLatin1Char('\\'), QLatin1String("\\e")).replace(QLatin1Char('-'), QLatin1String("\\-"));
    if (escaped.startsWith(QLatin1Char('.')) || escaped.startsWith(QLatin1Char('\'')))
        escaped.prepend(QLatin1String("\\&"));
    return escaped;
}

QString manualEntry(const OptionRow &row)
{
    QString entry = QLatin1String(".TP\n");
    if (row.isSwitch())
        entry += QStringLiteral(".B \\-\\-%1\n").arg(escaped(QLatin1String(row.name)));
    else
        entry += QStringLiteral(".BI \\-\\-%1 \" %2\"\n")
                     .arg(escaped(QLatin1String(row.name)), escaped(QLatin1String(row.valueName)));
    entry += escaped(helpOf(row)) + QLatin1Char('\n');
    if (*row.more != '\0')
        entry += escaped(QLatin1String(row.more)) + QLatin1Char('\n');
    return entry;
}

template <std::size_t Count>
QString manualEntries(const UsageRow (&rows)[Count])
{
    QString entries;
    for (const UsageRow &row : rows)
        entries += QStringLiteral(".TP\n.B %1\n%2\n")
                       .arg(escaped(QLatin1String(row.name)), escaped(QLatin1String(row.text)));
    return entries;
}

} // namespace

QString bashCompletion()
{
    QStringList names;
    QString values;
    for (const OptionRow &row : optionTable()) {
        names += dashed(row);
        if (!row.isSwitch())
            values += QStringLiteral("        %1) %2; return ;;\n").arg(dashed(row), completionCommand(row));
    }
    names += {QStringLiteral("--help"), QStringLiteral("--version")};
    return QStringLiteral(R"(# bash completion for fxscan

_fxscan_files() {
    mapfile -t COMPREPLY < <(compgen "$1" -- "${COMP_WORDS[COMP_CWORD]}")
    compopt -o filenames
}

_fxscan() {
    local current=${COMP_WORDS[COMP_CWORD]} previous=${COMP_WORDS[COMP_CWORD - 1]}
    COMPREPLY=()
    case $previous in
%1    esac
    if [[ $current == -* ]]; then
        mapfile -t COMPREPLY < <(compgen -W '%2' -- "$current")
    else
        _fxscan_files -f
    fi
}

complete -F _fxscan fxscan
)")
        .arg(values, names.join(QLatin1Char(' ')));
}

QString manualPage(QString manualTemplate)
{
    QString entries;
    for (const OptionRow &row : optionTable())
        entries += manualEntry(row);
    return manualTemplate.replace(QLatin1String("@OPTIONS@\n"), entries)
        .replace(QLatin1String("@SCANNER_ARGUMENTS@\n"), manualEntries(kScannerArguments))
        .replace(QLatin1String("@SCANNER_VARIABLES@\n"), manualEntries(kScannerVariables))
        .replace(QLatin1String("@SCANNER_EXITS@\n"), manualEntries(kScannerExits));
}
