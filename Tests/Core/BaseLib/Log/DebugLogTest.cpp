#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Log/LogSink.h"

#include "Tests/Core/BaseLib/Files/Fixtures.h"
#include "Tests/Support/CapturedLog.h"

#include <QRegularExpression>

#include <stdexcept>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

namespace {

/// Keeps each line with its level in front.
class LevelSink : public LogSink {
public:
    void write(int level, const QString &line) override { lines.append("%1|%2"_q.arg(level).arg(line)); }
    QStringList lines;
};

class ThrowingSink : public LogSink {
public:
    void write(int, const QString &) override { throw std::runtime_error("disk gone"); }
};

struct ThrowingText {
    operator QString() const { throw std::runtime_error("no text"); }
};

/// As the system keeps it: qputenv takes what one code page of Windows can say.
void setEnvironment(const char *name, const QString &value)
{
#ifdef _WIN32
    _wputenv_s(QString::fromLatin1(name).toStdWString().c_str(), value.toStdWString().c_str());
#else
    qputenv(name, value.toUtf8());
#endif
}

class FormatText : public testing::TestWithParam<const char *> {};

} // namespace

TEST_P(FormatText, KeepsEveryCharacterAndNumber)
{
    const LocaleScope locale(GetParam());
    if (!locale.isSet())
        GTEST_SKIP() << "this machine lacks the locale";
    const struct {
        const char *name;
        QString text;
        QString expected;
    } rows[] = {
        {"each kind of text", formatText(L"%ls,%s,%s,%ls", "q"_q, std::wstring(L"w"), "c", L"l"),
         "q,w,c,l"_q},
        {"null texts", formatText(L"<%s%ls>", static_cast<char *>(nullptr), static_cast<wchar_t *>(nullptr)),
         "<>"_q},
        {"null format", formatText(nullptr, 5), QString()},
        {"Japanese", formatText(L"音 %ls %s", "残響"_q, L"効果"), "音 残響 効果"_q},
        {"emoji", formatText(L"%ls🎸%s", std::wstring(L"🎹"), "\xF0\x9F\xA5\x81"), "🎹🎸🥁"_q},
        {"bytes that are no UTF-8", formatText(L"%s!", "a\xFF"), "a\uFFFD!"_q},
        {"percent in an argument", formatText(L"%ls%%", "%n%s"_q), "%n%s%"_q},
        {"numbers", formatText(L"%d %08X %.3f %lld", -5, 0xC0000005U, 1234.5, -5000000000LL),
         "-5 C0000005 1234.500 -5000000000"_q},
    };
    for (const auto &row : rows)
        EXPECT_EQ(row.text, row.expected) << row.name;
}

INSTANTIATE_TEST_SUITE_P(Locales, FormatText, testing::ValuesIn(kLocales));

TEST(DebugLog, SwitchesDecideWhereALineGoes)
{
    using Settings = DebugLogSettings;
    const struct {
        const char *name;
        void (*set)(Settings &);
        QStringList sink;
        QStringList direct;
    } rows[] = {
        {"as it starts", [](Settings &) {}, {"0|100* Fuzz 5*"_q}, {}},
        {"level", [](Settings &s) { s.level = 3; }, {"3|100* Fuzz 5*"_q}, {}},
        {"direct output", [](Settings &s) { s.directOutput = true; }, {}, {"0|100% Fuzz 5%"_q}},
        {"off", [](Settings &s) { s.off = s.trace = true; }, {}, {}},
        {"off and direct", [](Settings &s) { s.off = s.directOutput = true; }, {}, {}},
        {"trace", [](Settings &s) { s.trace = true; }, {"0|100* Fuzz 5*"_q, "0|Dispatch(5);"_q}, {}},
    };
    for (const auto &row : rows) {
        const CapturedLog log;
        const auto sink = std::make_shared<LevelSink>();
        const auto direct = std::make_shared<LevelSink>();
        setLogSink(sink);
        setDirectLogSink(direct);
        row.set(debugLogSettings());
        DebugLog(L"%ls %d%%", "100% Fuzz"_q, 5);
        DebugTrace(L"Dispatch(%d);", 5);
        EXPECT_EQ(sink->lines, row.sink) << row.name;
        EXPECT_EQ(direct->lines, row.direct) << row.name;
    }
}

TEST(DebugLog, CutsTheMessageAndNotTheTimeStamp)
{
    const QString emoji = "🎸"_q;
    const QString x999(999, QLatin1Char('x'));
    const struct {
        const char *name;
        QString message;
        QString expected;
    } rows[] = {
        {"exactly as long as allowed", x999 + 'y', x999 + 'y'},
        {"one too long", x999 + "yz", x999 + 'y'},
        {"a character of two units at the edge goes as a whole", x999 + emoji, x999},
    };
    for (const auto &row : rows) {
        const CapturedLog log;
        debugLogSettings().timeStamp = true;
        DebugLog(L"%ls", row.message);
        ASSERT_EQ(log.lines().size(), 1) << row.name;
        const QRegularExpression stamped("^ *\\d+\\.\\d{3}: (.*)$"_q);
        EXPECT_EQ(stamped.match(log.lines().first()).captured(1), row.expected) << row.name;
    }
}

TEST(DebugLog, ExceptionsEndInQtsDebugChannel)
{
    const CapturedLog log;
    const QtMessages messages;
    DebugLog(L"%ls", ThrowingText());
    setLogSink(std::make_shared<ThrowingSink>());
    DebugLog(L"lost");
    setLogSink(nullptr);
    DebugLog(L"no sink");
    const QString caught = " Caught an exception"_q;
    EXPECT_EQ(messages.lines(), QStringList({caught, caught}));
}

TEST(DebugLog, LinesOfSeveralThreadsStayWholeInTheFileThatTheEnvironmentNames)
{
    const CapturedLog log;
    const EmptyFolder folder;
    setEnvironment("FXPROBE_LOG", folder.write("音.log"_q, QByteArray("earlier run") + kLineEnd));
    qputenv("FXPROBE_TRACE", "1");
    configureLogFromEnvironment();
    qunsetenv("FXPROBE_LOG");
    qunsetenv("FXPROBE_TRACE");
    QStringList expected{"earlier run"_q};
    for (int number = 0; number < 800; ++number)
        expected.append(formatText(L"%d %ls", number, QString(number % 200, QChar(u'残'))));
    std::vector<std::thread> threads;
    for (int part = 0; part < 4; ++part)
        threads.emplace_back([part] {
            for (int number = part * 200; number < (part + 1) * 200; ++number)
                DebugTrace(L"%d %ls", number, QString(number % 200, QChar(u'残')));
        });
    for (std::thread &thread : threads)
        thread.join();
    QStringList lines = QString::fromUtf8(contentOf(folder.path("音.log"_q))).split(QLatin1String(kLineEnd));
    lines.removeAll(QString());
    lines.sort();
    expected.sort();
    EXPECT_EQ(lines, expected);
}
