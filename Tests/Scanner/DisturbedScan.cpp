#include "Tests/Scanner/DisturbedScan.h"

DisturbedScan::DisturbedScan(const QByteArray &script)
{
    for (int i = 0; i < 12; ++i)
        m_names.append(QStringLiteral("M%1").arg(i, 2, 10, QLatin1Char('0')));
    addListedModules(m_names);
    editCatalogue("<Favourite>0<", "<Favourite>1<");
    QByteArray text = m_folder.catalogue();
    const int record = text.indexOf("/M03.vst3<");
    const int enabled = text.indexOf("<Enabled>1<", record);
    m_folder.write(cataloguePath(), text.replace(enabled, 11, "<Enabled>0<"));
    for (const QString &name : m_names)
        addModule(name, script);
    touchModules(m_names);
}

std::set<QString> DisturbedScan::namedByMarkers() const
{
    std::set<QString> named;
    for (const QString &marker : m_folder.markers())
        named.insert(marker.section('.', 0, 0));
    return named;
}

void DisturbedScan::expectSettled(const std::set<QString> &named) const
{
    EXPECT_LE(runUntilSettled(scannerProgram(), m_folder).size(), 1 + named.size());
    EXPECT_EQ(listed(), m_names);
    for (const auto &[name, record] : records()) {
        const bool mayBeOff = named.count(name) == 1;
        EXPECT_TRUE(record.favourite) << qPrintable(name);
        EXPECT_TRUE(record.working || mayBeOff) << qPrintable(name);
        EXPECT_TRUE(record.enabled || mayBeOff || name == switchedOff()) << qPrintable(name);
        EXPECT_FALSE(record.enabled && name == switchedOff());
    }
}
