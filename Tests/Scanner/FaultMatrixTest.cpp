#include "Main/AudioEngineController/Effects/Catalogue/CatalogueFormat.h"
#include "Main/AudioEngineController/Effects/Catalogue/PluginFormats.h"
#include "Tests/Support/PlatformValues.h"
#include "Tests/Support/ScanBench.h"

#include <QFileInfo>
#include <QRegularExpression>

namespace {

/// What becomes of a module that commits a fault at a stage. "M" is the module's own record, letters before
/// it those of its plug-ins A, B and C, of which B commits the fault where the stage is one plug-in's. "!":
/// it ended the scanner and is disabled; "?": it is recorded as not working; "-": nothing is recorded, and it
/// is tried again. Where systems differ: Linux/Windows.
const char kMatrix[] = R"(
stages                                          segv   abort exit _exit divide illegal stack-overflow throw-std throw-int terminate kill pthread-exit hang
vst3:static-constructor,clap:static-constructor M!/M?  M!    M!   M!    M!/M?  M!/M?   M!/M?          M!        M!        M!        M!   M!           M!
vst3:module-entry,clap:entry-init               M!     M!    M!   M!    M!     M!      M!             M?        M?        M!        M!   M!           M!
vst3:get-factory,clap:get-factory               M!     M!    M!   M!    M!     M!      M!             -         -         M!        M!   M!           M!
vst3:factory-info                               M!     M!    M!   M!    M!     M!      M!             M?        M?        M!        M!   M!           M!
vst3:count-classes,clap:plugin-count            M!     M!    M!   M!    M!     M!      M!             M?        M?        M!        M!   M!           M!
vst3:class-info,clap:descriptor                 M!     M!    M!   M!    M!     M!      M!             A         A         M!        M!   M!           M!
vst3:class-info2                                M!     M!    M!   M!    M!     M!      M!             A         A         M!        M!   M!           M!
vst3:class-info-unicode                         M!     M!    M!   M!    M!     M!      M!             A         A         M!        M!   M!           M!
vst3:create-instance,clap:create-plugin         M!     M!    M!   M!    M!     M!      M!             A         A         M!        M!   M!           M!
vst3:initialize,clap:init,clap:get-extension    M!     M!    M!   M!    M!     M!      M!             A         A         M!        M!   M!           M!
vst3:bus-count,clap:port-count                  M!     M!    M!   M!    M!     M!      M!             A         A         M!        M!   M!           M!
vst3:bus-info,clap:port-info                    M!     M!    M!   M!    M!     M!      M!             A         A         M!        M!   M!           M!
vst3:terminate,clap:destroy                     M!     M!    M!   M!    M!     M!      M!             AB        AB        M!        M!   M!           M!
vst3:release                                    M!     M!    M!   M!    M!     M!      M!             AB        AB        M!        M!   M!           M!
vst3:factory-release                            M!     M!    M!   M!    M!     M!      M!             ABC       ABC       M!        M!   M!           M!
vst3:module-exit,clap:entry-deinit              M!     M!    M!   M!    M!     M!      M!             ABC       ABC       M!        M!   M!           M!
vst3:static-destructor,clap:static-destructor   M!/ABC M!    M!   M!    M!/ABC M!/ABC  M!/ABC         M!        M!        M!        M!   M!           M!
vst2:static-constructor                         M!/M?  M!    M!   M!    M!/M?  M!/M?   M!/M?          M!        M!        M!        M!   M!           M!
vst2:entry                                      M?     M!    M!   M!    M?     M?      M?             M?        M?        M!        M!   M!           M!
vst2:get-plug-category                          M      M!    M!   M!    M      M       M              M         M         M!        M!   M!           M!
vst2:get-effect-name                            M      M!    M!   M!    M      M       M              M         M         M!        M!   M!           M!
vst2:get-vendor-string                          M      M!    M!   M!    M      M       M              M         M         M!        M!   M!           M!
vst2:close                                      M      M!    M!   M!    M      M       M              M         M         M!        M!   M!           M!
vst2:static-destructor                          M!/M   M!    M!   M!    M!/M   M!/M    M!/M           M!        M!        M!        M!   M!           M!
shell:shell-next                                A      M!    M!   M!    A      A       A              A         A         M!        M!   M!           M!
shell:entry                                     AB?C   AB!C  AB!C AB!C  AB?C   AB?C    AB?C           AB?C      AB?C      AB!C      AB!C AB!C         AB!C
shell:get-plug-category                         ABC    AB!C  AB!C AB!C  ABC    ABC     ABC            ABC       ABC       AB!C      AB!C AB!C         AB!C
shell:get-effect-name                           ACM    AB!C  AB!C AB!C  ACM    ACM     ACM            ACM       ACM       AB!C      AB!C AB!C         AB!C
shell:get-vendor-string                         ABC    AB!C  AB!C AB!C  ABC    ABC     ABC            ABC       ABC       AB!C      AB!C AB!C         AB!C
shell:close                                     ABC    AB!C  AB!C AB!C  ABC    ABC     ABC            ABC       ABC       AB!C      AB!C AB!C         AB!C
shell:static-destructor                         M!/ABC M!    M!   M!    M!/ABC M!/ABC  M!/ABC         M!        M!        M!        M!   M!           M!
)";

QStringList words(const QString &line) { return line.split(' ', Qt::SkipEmptyParts); }

/// The head, then a line for each format and stage: "vst3 initialize M! …".
QStringList matrixLines()
{
    QStringList lines;
    for (const QString &line : QString::fromLatin1(kMatrix).split('\n', Qt::SkipEmptyParts))
        for (const QString &stage : line.section(' ', 0, 0).split(','))
            lines.append(QString(stage).replace(':', ' ') + ' ' + line.section(' ', 1));
    return lines;
}

/// A line of the matrix: the format and the stage, then what becomes of each kind of fault.
class FaultMatrix : public ScanBench, public testing::WithParamInterface<int> {
protected:
    FaultMatrix()
        : m_kinds(words(matrixLines().first()).mid(1))
        , m_cells(words(matrixLines().at(GetParam())).mid(2))
        , m_format(words(matrixLines().at(GetParam())).at(0))
        , m_stage(words(matrixLines().at(GetParam())).at(1))
    {}
    bool isOfOnePlugin() const
    {
        static const QRegularExpression whole(
            "^(static|module|factory|get-factory|count|entry-|plugin-count)");
        return m_format != "vst2" && !whole.match(m_stage).hasMatch();
    }
    void add(const QString &kind) const
    {
        const QByteArray name = kind.toUtf8();
        QByteArray script;
        if (m_format != "vst2")
            for (const char *letter : {"A", "B", "C"})
                script +=
                    (m_format == "shell" ? "child " + QByteArray::number(*letter) + " \"" : "class \"") +
                    name + ' ' + letter + "\"\n";
        if (kind != "healthy")
            script +=
                "fault " + m_stage.toUtf8() + ' ' + name + (isOfOnePlugin() ? " \"" + name + " B\"\n" : "\n");
        put(kind + '.' + (m_format == "shell" ? "vst2" : m_format), script);
    }
    /// Runs the scanner until no marker survives; what hangs is ended from outside, or by the scanner that
    /// has workers. The number of runs.
    int runs() const
    {
        const int most = 2 * m_kinds.size();
        for (int run = 1; run <= most; ++run) {
            forgetTrace();
            ScannerRun scanner(scannerProgram(), m_folder);
            scanner.setEnvironment("FXPROBE_PROBE_LIMIT", "3");
            EXPECT_TRUE(scanner.start());
            if (!hasWorkers() && waitForStage(scanner, "hang", m_stage + (isOfOnePlugin() ? " hang B" : "")))
                scanner.kill();
            scanner.wait();
            if (m_folder.markers().isEmpty())
                return run;
        }
        return most;
    }
    /// The cell that the catalogue says.
    QString found(const QString &kind) const;
    /// What the scanner keeps of a kind's module.
    QString reason(const QString &kind) const
    {
        for (const QString &line : m_folder.lines("Effects/FXProbes.json"))
            if (line.contains("/Plugins/" + kind + '.'))
                return line;
        return QString();
    }

    QStringList m_kinds, m_cells;
    QString m_format, m_stage;
};

QString FaultMatrix::found(const QString &kind) const
{
    QStringList found;
    const PluginFormatInfo *const format = formatOfKey(m_format == "shell" ? "vst2" : m_format);
    const QString file = QString(format->catalogue->fileName).mid(1);
    for (const QString &row : recordsOf(file, "Name Path Enabled Working")) {
        const QStringList values = row.split('|');
        if (QFileInfo(values[1]).completeBaseName() != kind)
            continue;
        const char *state = values[3] == "1" ? "" : values[2] == "1" ? "?" : "!";
        found.append((values[0] == kind ? "M" : values[0].right(1)) + state);
    }
    found.sort();
    return found.isEmpty() ? "-" : found.join(QString());
}

} // namespace

TEST_P(FaultMatrix, EndsAsItSays)
{
    for (const QString &kind : m_kinds)
        add(kind);
    add("healthy");
    const int needed = runs();
    QStringList cells, expected;
    for (const QString &kind : m_kinds)
        cells.append(found(kind));
    for (const QString &cell : m_cells)
        expected.append(cell.contains('/') ? cell.split('/').value(kSystemsPlace) : cell);
    EXPECT_EQ(cells.join(' '), expected.join(' '));
    EXPECT_EQ(needed, hasWorkers() ? 1 : cells.join(QString()).count('!') + 1)
        << "one run each, and the last one";
    EXPECT_EQ(found("healthy"), m_format == "vst2" ? "M" : "ABC");
    for (const QString &kind : QStringList{"segv", "divide", "illegal", "stack-overflow"})
        if (hasWorkers() && cells[m_kinds.indexOf(kind)].contains('!')) {
            EXPECT_TRUE(reason(kind).contains(" in " + kind + '.')) << qPrintable(reason(kind));
        }
}

INSTANTIATE_TEST_SUITE_P(Of, FaultMatrix, testing::Range(1, static_cast<int>(matrixLines().size())),
                         [](const auto &row) {
                             const QStringList line = words(matrixLines().at(row.param)).mid(0, 2);
                             return line.join('_').remove('-').toStdString();
                         });
