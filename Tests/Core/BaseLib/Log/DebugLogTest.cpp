#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Log/LogSink.h"

#include "Tests/Support/CapturedLog.h"
#include "Tests/Support/TestFolder.h"

#include <stdexcept>
#include <thread>

#include <gtest/gtest.h>

namespace {

struct ThrowingText {
    operator QString() const { throw std::runtime_error("no text"); }
};

} // namespace

TEST(FormatText, KeepsEveryCharacterAndNumber)
{
    const std::pair<QString, QString> rows[] = {
        {formatText(L"%ls,%s,%s,%ls", QString("q"), std::wstring(L"w"), "c", L"l"), "q,w,c,l"},
        {formatText(L"<%s%ls>", static_cast<char *>(nullptr), static_cast<wchar_t *>(nullptr)), "<>"},
        {formatText(nullptr, 5), ""},
        {formatText(L"音 %ls🎸 %s", QString("残響"), L"効果"), "音 残響🎸 効果"},
        {formatText(L"%s!", "a\xFF"), "a\uFFFD!"},
        {formatText(L"%ls%%", QString("%n%s")), "%n%s%"},
        {formatText(L"%d %08X %.3f %lld", -5, 0xC0000005U, 1.5, -5000000000LL),
         "-5 C0000005 1.500 -5000000000"},
        {cutText("x🎸", 2), "x"},
    };
    for (const auto &[text, expected] : rows)
        EXPECT_EQ(text, expected);
}

TEST(DebugLog, SwitchesDecideWhereALineGoes)
{
    for (const bool isDirect : {false, true}) {
        const CapturedLog log; // puts the switches back
        const auto direct = std::make_shared<CapturedLog::Sink>();
        setDirectLogSink(direct);
        debugLogSettings().directOutput = isDirect;
        DebugLog(L"%ls", QString("100% Fuzz\n\x1b[2J"));
        DebugLog(L"%ls", ThrowingText());
        debugLogSettings().off = true;
        DebugLog(L"not logged");
        EXPECT_EQ(log.lines(), isDirect ? QStringList() : QStringList("100* Fuzz??[2J"));
        EXPECT_EQ(direct->lines, isDirect ? QStringList("100% Fuzz\n\x1b[2J") : QStringList());
    }
}

TEST(DebugLog, LinesOfSeveralThreadsAndProgramsStayWholeAndAreCut)
{
    const CapturedLog log;
    const TestFolder folder;
    folder.write("音.log", "earlier run\n");
    setLogSink(FileLogSink::appendingTo(folder.path("音.log")));
    const auto other = FileLogSink::appendingTo(folder.path("音.log"));
    const QString text(1500, u'残');
    std::thread second([&] { DebugLog(L"%ls", text); });
    DebugLog(L"%ls", text);
    second.join();
    other->write(0, "other");
    EXPECT_EQ(folder.lines("音.log"),
              QStringList({"earlier run", text.left(1000), text.left(1000), "other"}));
}
