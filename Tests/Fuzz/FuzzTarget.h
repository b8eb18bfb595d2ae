#pragma once

#include <QByteArray>
#include <QString>
#include <QTemporaryDir>

#include <initializer_list>

/// What reads bytes of somebody else's, each with the rules that hold whatever the bytes are. A broken rule
/// is thrown as a std::logic_error; everything else is the sanitizers' to find.
struct FuzzTarget {
    const char *name; ///< also of its folder in corpus/
    void (*run)(const QByteArray &input);
};

void fuzzCatalogue(const QByteArray &input);
void fuzzElf(const QByteArray &input);
void fuzzKnown(const QByteArray &input);
void fuzzMarker(const QByteArray &input);
void fuzzPe(const QByteArray &input);
void fuzzProbes(const QByteArray &input);
void fuzzChannel(const QByteArray &input);
void fuzzReport(const QByteArray &input);
void fuzzScanList(const QByteArray &input);

inline constexpr FuzzTarget kFuzzTargets[] = {
    {"catalogue", fuzzCatalogue},
#ifndef _WIN32 // where nothing reads ELF files
    {"elf", fuzzElf},
#endif
    {"known", fuzzKnown},
    {"marker", fuzzMarker},
    {"pe", fuzzPe},
    {"probes", fuzzProbes},
    {"channel", fuzzChannel},
    {"report", fuzzReport},
    {"scanlist", fuzzScanList},
};

void require(bool holds, const char *rule);

/// A folder of its own for the files of the targets, the working folder while this lives. Holds
/// "here/Comp.so" and "here/Comp.vst3".
class FuzzFolder {
public:
    FuzzFolder();
    ~FuzzFolder();
    FuzzFolder(const FuzzFolder &) = delete;
    FuzzFolder &operator=(const FuzzFolder &) = delete;

private:
    QString m_outside;
    QTemporaryDir m_folder;
};

void writeFuzzFile(const QString &name, const QByteArray &content);

/// Whether one of the texts holds one of the characters.
bool anyHolds(std::initializer_list<QString> texts, const char *characters);
