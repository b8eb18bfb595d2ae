#include "Core/BaseLib/Files/XMLDocument.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"

#include <limits>

#include <gtest/gtest.h>

namespace {

QByteArray effectNamed(const QByteArray &name)
{
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<Effects>\n\t<Name>" + name + "</Name>\n</Effects>\n";
}

QString nameIn(const XMLDocument &document) { return document.root("Effects").child("Name").text(); }

} // namespace

TEST(XMLDocument, ReadsTextsAsTheyWereWritten)
{
    const struct {
        const char *name;
        QByteArray xml;
        QString text;
    } rows[] = {
        {"plain", effectNamed("Fuzz"), "Fuzz"_q},
        {"one blank", effectNamed(" "), " "_q},
        {"blanks around", effectNamed(" Comp "), " Comp "_q},
        {"empty", effectNamed(""), QString()},
        {"no such element", "<Effects><Other>x</Other></Effects>", QString()},
        {"no such root", "<Scan><Name>x</Name></Scan>", QString()},
        {"bare ampersand", effectNamed("Drum & Bass &"), "Drum & Bass &"_q},
        {"unknown entity", effectNamed("a&fuzz;b"), "a&fuzz;b"_q},
        {"entities", effectNamed("a&amp;&lt;&#233;"), "a&<é"_q},
        {"Japanese and emoji", effectNamed("残響🎸"), "残響🎸"_q},
        {"bytes that are no UTF-8", effectNamed("a\xFF"), "a\uFFFD"_q},
        {"byte order mark", "\xEF\xBB\xBF" + effectNamed("x"), "x"_q},
        {"Windows line ends", "<Effects>\r\n<Name>x</Name>\r\n</Effects>\r\n", "x"_q},
    };
    for (const auto &row : rows) {
        XMLDocument document;
        EXPECT_TRUE(document.parse(row.xml)) << row.name << ": " << document.error().toStdString();
        EXPECT_EQ(nameIn(document), row.text) << row.name;
    }
}

TEST(XMLDocument, RefusesWhatIsNotWellFormed)
{
    QList<QByteArray> faulty{"", "hello", effectNamed("a < b"), effectNamed("a<b>c"), "<Effects></Scan>"};
    const QByteArray good = effectNamed("Fuzz").trimmed();
    for (int length = 0; length < good.size(); ++length)
        faulty.append(good.left(length));
    for (const QByteArray &xml : faulty) {
        XMLDocument document;
        ASSERT_TRUE(document.parse(good));
        EXPECT_FALSE(document.parse(xml)) << xml.constData();
        EXPECT_FALSE(document.error().isEmpty()) << xml.constData();
        EXPECT_FALSE(document.root("Effects")) << "half a document is left: " << xml.constData();
    }
}

TEST(XMLDocument, FindsElementsInOrderAndAttributes)
{
    XMLDocument document;
    ASSERT_TRUE(document.parse("<Scan a='' version='1.1'><Path>b</Path><x/><Path>a</Path></Scan>"));
    const XMLElement root = document.root("Scan");
    QStringList paths;
    for (const XMLElement &path : root.children("Path"))
        paths.append(path.text());
    EXPECT_EQ(paths, QStringList({"b"_q, "a"_q}));
    EXPECT_EQ(root.attribute("version"), "1.1"_q);
    EXPECT_EQ(root.attribute("a"), QString());
    EXPECT_EQ(root.attribute("b"), std::nullopt);
    const XMLElement missing = root.child("none").child("below");
    EXPECT_FALSE(missing);
    EXPECT_TRUE(missing.children("Path").empty());
    EXPECT_EQ(missing.attribute("version"), std::nullopt);
}

TEST(Numbers, AreReadTheSameInEveryLocale)
{
    const struct {
        const char *text;
        qint64 integer;
        double decimal;
    } rows[] = {
        {"", 0, 0.0},
        {"junk", 0, 0.0},
        {"-", 0, 0.0},
        {"0x10", 0, 0.0},
        {"1.4", 1, 1.4},
        {"1,4", 1, 1.0},
        {" 12 ", 12, 12.0},
        {"-7", -7, -7.0},
        {"12abc", 12, 12.0},
        {"010", 10, 10.0},
        {"4294967295", 4294967295LL, 4294967295.0},
        {"99999999999999999999", std::numeric_limits<qint64>::max(), 1e20},
        {"-99999999999999999999", std::numeric_limits<qint64>::min(), -1e20},
        {"nan", 0, 0.0},
        {"-inf", 0, 0.0},
        {"1e999", 1, 0.0},
        {"\xEF\xBC\x95", 0, 0.0}, // a full-width five
    };
    for (const char *name : kLocales) {
        const LocaleScope locale(name);
        for (const auto &row : rows) {
            const QString text = QString::fromUtf8(row.text);
            EXPECT_EQ(parseInteger(text), row.integer) << row.text << " in " << name;
            EXPECT_EQ(parseDecimal(text), row.decimal) << row.text << " in " << name;
        }
    }
    EXPECT_EQ(parseInteger("+5"_q), 5);
}
