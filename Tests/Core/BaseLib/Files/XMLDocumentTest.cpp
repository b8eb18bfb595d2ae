#include "Core/BaseLib/Files/XMLDocument.h"

#include "Tests/Support/QtPrinters.h"

#include <clocale>
#include <limits>

#include <gtest/gtest.h>

namespace {
QByteArray effectNamed(const QByteArray &name) { return "<Effects><Name>" + name + "</Name></Effects>"; }
} // namespace

TEST(XMLDocument, ReadsTextsAsTheyWereWritten)
{
    const std::pair<QByteArray, QString> rows[] = {
        {effectNamed(" "), " "},
        {effectNamed(" Comp "), " Comp "},
        {"<Scan><Name>x</Name></Scan>", ""},
        {effectNamed("Drum & Bass &"), "Drum & Bass &"},
        {effectNamed("a&fuzz;b&amp;&lt;&#233;"), "a&fuzz;b&<é"},
        {effectNamed("残響🎸\r\n"), "残響🎸\r\n"},
        {effectNamed("a\xFF"), "a\uFFFD"},
        {"\xEF\xBB\xBF" + effectNamed("x"), "x"},
    };
    for (const auto &[xml, text] : rows) {
        XMLDocument document;
        EXPECT_TRUE(document.parse(xml)) << xml.constData();
        EXPECT_EQ(document.root("Effects").child("Name").text(), text) << xml.constData();
        EXPECT_FALSE(document.parse(xml + "<") || document.root("Effects")) << "half a document is left";
    }
}

TEST(Numbers, AreReadTheSameInEveryLocale)
{
    const struct {
        QString text;
        qint64 integer;
        double decimal;
    } rows[] = {
        {"", 0, 0.0},      {"junk", 0, 0.0},
        {"0x10", 0, 0.0},  {"1.4", 1, 1.4},
        {"1,4", 1, 1.0},   {" 12 ", 12, 12.0},
        {"-7", -7, -7.0},  {"12abc", 12, 12.0},
        {"010", 10, 10.0}, {"nan", 0, 0.0},
        {"-inf", 0, 0.0},  {"1e999", 1, 0.0},
        {"５", 0, 0.0},    {"99999999999999999999", std::numeric_limits<qint64>::max(), 1e20},
    };
    const std::string before = std::setlocale(LC_ALL, nullptr);
    for (const char *name : {"C", "de_DE.UTF-8"}) { // the latter, with its comma, where the machine has it
        std::setlocale(LC_ALL, name);
        for (const auto &row : rows) {
            EXPECT_EQ(parseInteger(row.text), row.integer) << row.text.toStdString() << " in " << name;
            EXPECT_EQ(parseDecimal(row.text), row.decimal) << row.text.toStdString() << " in " << name;
        }
    }
    std::setlocale(LC_ALL, before.c_str());
}
