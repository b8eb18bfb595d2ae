#include "Main/VLib/VObject.h"

#include "Tests/Support/CapturedLog.h"

#include <gtest/gtest.h>

#include <climits>

namespace {
class NumberedObject : public VObject {
public:
    explicit NumberedObject(int identifier)
        : VObject(identifier)
    {}
    const char *className() const override { return "NumberedObject"; }
};
} // namespace

TEST(VObject, ComparesByIdentifierAndComplains)
{
    const struct {
        const char *name;
        int left;
        int right;
        int order;
    } rows[] = {
        {"equal", 7, 7, 0},
        {"smaller", -1, 7, -1},
        {"larger", 7, -1, 1},
        {"further apart than an int can hold", INT_MIN, INT_MAX, -1},
    };
    for (const auto &row : rows) {
        const CapturedLog log;
        EXPECT_EQ(NumberedObject(row.left).compare(NumberedObject(row.right)), row.order) << row.name;
        EXPECT_EQ(log.lines(), QStringList("Assertion failed: \"0\", Main/VLib/VObject, line 273"))
            << row.name;
    }
}
