#include "services/model_map.h"

#include <gtest/gtest.h>

#include <string>

#include "platform/com/types.h"

namespace qn {
namespace {

// A model-keyed row holding one number.
struct NumberRow : CModelBasedType {
    NumberRow(std::string model, LONG v) : CModelBasedType(std::move(model)), value(v) {}
    LONG value;
};

TEST(ModelBasedMap, LookupPrefersExactModelThenEveryModel) {
    CModelBasedMap<NumberRow> m{NumberRow("", 1), NumberRow("QDS4032A", 2)};
    struct Case {
        const char* model;
        LONG expected;
    } cases[] = {{"QDS4032A", 2}, {"qds4032a", 1}, {"QDS9999", 1}, {"", 1}};
    for (const Case& c : cases) {
        ASSERT_NE(m.Lookup(c.model), nullptr) << c.model;
        EXPECT_EQ(m.Lookup(c.model)->value, c.expected) << c.model;
    }
}

TEST(ModelBasedMap, NoRowWithoutEveryModelRowAndLaterRowReplaces) {
    CModelBasedMap<NumberRow> m{NumberRow("A", 1)};
    EXPECT_EQ(m.Lookup("B"), nullptr);
    EXPECT_EQ(m.Lookup(""), nullptr);
    m.AddRow(NumberRow("A", 3));
    EXPECT_EQ(m.size(), 1u);
    EXPECT_EQ(m.Lookup("A")->value, 3);
}

}  // namespace
}  // namespace qn
