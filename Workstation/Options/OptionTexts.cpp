#include "Workstation/Options/OptionTexts.h"

#include "Main/AudioEngineController/Effects/Protocol/ScannerUsage.h"
#include "Workstation/Options/OptionTable.h"

#include <map>

namespace {

QString dashed(const OptionRow &row) { return QLatin1String("--") + QLatin1String(row.name); }

/// Those plug-ins that an option is about: words for `--only`. None: all.
QString pluginsFor(const OptionRow &row)
{
    const std::map<QLatin1String, const char *> words{{QLatin1String("retry"), " failed disabled"},
                                                      {QLatin1String("switch-off"), " ok"},
                                                      {QLatin1String("switch-on"), " switched-off"},
                                                      {QLatin1String("no-favourite"), " favourite"}};
    const auto found = words.find(QLatin1String(row.name));
    return found == words.end() ? QString() : QLatin1String(found->second);
}

/// What the shell runs to offer values.
QString completionCommand(const OptionRow &row)
{
    if (const auto *target = std::get_if<ChoiceTarget>(&row.target)) {
        QStringList words;
        for (const char *choice : target->choices)
            words += QLatin1String(choice);
        return QLatin1String("_fxscan_words ") + words.join(QLatin1Char(' '));
    }
    if (const auto *target = std::get_if<WordsTarget>(&row.target))
        return QLatin1String("_fxscan_words ") + target->words().join(QLatin1Char(' '));
    const QLatin1String valueName(row.valueName);
    if (valueName == QLatin1String("name"))
        return QLatin1String("_fxscan_plugins") + pluginsFor(row);
    if (valueName == QLatin1String("folder"))
        return QStringLiteral("_fxscan_files -d");
    if (valueName == QLatin1String("file") || valueName == QLatin1String("path"))
        return QStringLiteral("_fxscan_files -f");
    return QStringLiteral(":");
}

/// The completion but for its options: %1 is a branch for each that takes a value, %2 are all of them.
constexpr char kCompletion[] = R"bash(# bash completion for fxscan

_fxscan_files() { # -d|-f
    mapfile -t COMPREPLY < <(compgen "$1" -- "$current")
    compopt -o filenames
}

_fxscan_words() { # WORD...: one that ends in "=" goes on with a value
    if [[ $current == vendor=* && $* == *vendor=* ]]; then
        _fxscan_catalogue 5 vendor=
    else
        mapfile -t COMPREPLY < <(compgen -W "$*" -- "$current")
        [[ ${COMPREPLY[0]} != *= ]] || compopt -o nospace
    fi
}

# Texts of the catalogue come from plug-ins: nothing here may take them for more than text.
_fxscan_catalogue() { # GROUP PREFIX WORD...: what of each plug-in, what comes before it, and which plug-ins
    local text='("(([^"]|"")*)"|([^",]*))' group=$1 prefix=$2 only=() data=() line value at
    shift 2
    for value in "$@"; do only+=(--only "$value"); done
    for ((at = 0; at < ${#words[@]}; ++at)); do
        case ${words[at]} in
        --data-folder) value=${words[at + 1]} ;;
        --data-folder=*) value=${words[at]#*=} ;;
        *) continue ;;
        esac
        data=(--data-folder "${value/#\~/$HOME}")
    done
    while IFS= read -r line; do
        [[ $line != format,name,* && $line =~ ^[a-z0-9]+,$text,$text, ]] || continue
        value=${BASH_REMATCH[group + 1]}${BASH_REMATCH[group + 3]}
        value=${value//\"\"/\"}
        [[ $value != \'[=+@-]* ]] || value=${value#\'} # it is no formula here
        value=$prefix$value
        [[ $value == "$current"* ]] && COMPREPLY+=("$value")
    done < <(timeout 2 "${words[0]/#\~/$HOME}" "${data[@]}" --list --format csv "${only[@]}" 2>/dev/null)
    compopt -o filenames
}

_fxscan_plugins() { # WORD...: a plug-in's name, or its path
    if [[ $current == */* ]]; then
        _fxscan_files -f
    else
        _fxscan_catalogue 1 '' "$@"
    fi
}

_fxscan() {
    local words=() word last='' current option lead='' fragment=${COMP_WORDS[COMP_CWORD]}
    # Bash parts words at "=".
    for word in "${COMP_WORDS[@]:0:COMP_CWORD + 1}"; do
        if [[ $word == = || $last == = ]] && ((${#words[@]} > 1)); then
            words[-1]+=$word
        else
            words+=("$word")
        fi
        last=$word
    done
    [[ $fragment != = ]] || fragment=
    current=${words[-1]} option=${words[-2]}
    if [[ $current == --*=* ]]; then
        option=${current%%=*} lead=${current%%=*}= current=${current#*=}
    fi
    word=$lead$current # what was typed of it, as it is spelled
    current=${current#[\"\']}
    current=${current//\\/}
    COMPREPLY=()
    case $option in
%1    *)
        if [[ $current == -* ]]; then
            _fxscan_words %2
        else
            _fxscan_files -f
        fi
        ;;
    esac
    COMPREPLY=("${COMPREPLY[@]/#/$lead}")
    COMPREPLY=("${COMPREPLY[@]#"${word%"$fragment"}"}")
}

complete -F _fxscan fxscan
)bash";

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
            values += QStringLiteral("    %1) %2 ;;\n").arg(dashed(row), completionCommand(row));
    }
    names += {QStringLiteral("--help"), QStringLiteral("--version")};
    return QString::fromLatin1(kCompletion).arg(values, names.join(QLatin1Char(' ')));
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
