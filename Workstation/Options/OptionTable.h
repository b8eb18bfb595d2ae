#pragma once

#include "Workstation/Options/ScanOptions.h"

#include <QCommandLineOption>
#include <QList>

#include <variant>
#include <vector>

/// A whole number that an option takes, and what it must be.
struct NumberTarget {
    int ScanOptions::*member;
    int least;
    int most;
    const char *unit; ///< for the message, for example "seconds"
};

/// One of several words.
struct ChoiceTarget {
    std::vector<const char *> choices;
    void (*choose)(ScanOptions &options, size_t choice); ///< stores which was given
};

/// Words, each one of some; can be given several times. A word of the list that ends in "=" stands for all
/// that begin with it.
struct WordsTarget {
    QStringList ScanOptions::*member;
    QStringList (*words)();
};

/// Where the value of an option goes. A switch sets its member to true; an option with a list can be given
/// several times.
using OptionTarget = std::variant<bool ScanOptions::*, QString ScanOptions::*, QStringList ScanOptions::*,
                                  NumberTarget, ChoiceTarget, WordsTarget>;

/// One option of fxscan: command line, help, completion and manual are all made from this row.
struct OptionRow {
    const char *name;      ///< without the dashes
    const char *valueName; ///< empty for a switch; for "folder", "file" and "path" a shell offers
                           ///< just these
    OptionTarget target;
    const char *help;      ///< for `--help` and the manual, see `helpOf`
    const char *more = ""; ///< what only the manual adds

    bool isSwitch() const { return *valueName == '\0'; }
};

/// Two options that contradict each other.
struct OptionConflict {
    const char *option;
    const char *other;
    QString reason; ///< the beginning of the message
};

/// All options but `--help` and `--version`, in the order in which they are shown.
const std::vector<OptionRow> &optionTable();
const std::vector<OptionConflict> &optionConflicts();
/// The options that do something else than a scan. They take no folders to scan.
const std::vector<const char *> &optionsWithoutScan();

/// What `--help` and the manual say of an option; in a row of words they stand at "%1".
QString helpOf(const OptionRow &row);

/// The table for a `QCommandLineParser`.
QList<QCommandLineOption> commandLineOptions();

/// Stores the values that were given for an option, for a switch none. Returns what is wrong with them, else
/// an empty text.
QString storeValues(const OptionRow &row, const QStringList &values, ScanOptions &options);
