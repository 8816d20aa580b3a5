// What every attribute call looks up: the attribute by its ID, and the first
// name of the selector, trimmed, with every element of the list checked.
#include <gtest/gtest.h>

#include <set>

#include "Qn731XX.h"
#include "capi/attribute_table.h"
#include "capi/selector.h"

namespace {

TEST(Selector, FirstNameOrBadlyFormed) {
    struct Case {
        const char* selector;
        const char* first;  // null: badly formed
    };
    const Case cases[] = {
        {"Channel2", "Channel2"},
        {" \tChannel2\t ", "Channel2"},
        {"Channel1 , Channel2", "Channel1"},
        {"Ch an", "Ch an"},
        {"x", "x"},
        {nullptr, nullptr},
        {"", nullptr},
        {" \t ", nullptr},
        {",Channel1", nullptr},
        {"Channel1,", nullptr},
        {"Channel1, ,Channel2", nullptr},
        {"Channel1:Meas1", nullptr},
        {"Channel[1]", nullptr},
        {"Channel1,Channel2]", nullptr},
        {"Channel1,a:b", nullptr},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.selector ? c.selector : "(null)");
        std::string_view name = "unchanged";
        const ViStatus status = qn::capi::FirstSelectorName(0, c.selector, &name);
        if (c.first) {
            EXPECT_EQ(status, VI_SUCCESS);
            EXPECT_EQ(name, c.first);
        } else {
            EXPECT_EQ(status, IVI_ERROR_BADLY_FORMED_SELECTOR);
            EXPECT_EQ(name, "unchanged");
        }
    }
}

// Each row is found by its own ID (two rows with one ID would hide one of
// them); IDs next to known ones and the bases of the ID ranges are unknown.
TEST(AttributeLookup, EveryRowByItsIdAndNothingElse) {
    std::set<ViAttr> ids;
    for (const qn::capi::AttributeRow& row : qn::capi::AttributeRows()) {
        SCOPED_TRACE(std::string(row.name));
        EXPECT_TRUE(ids.insert(row.id).second);
        EXPECT_EQ(qn::capi::FindAttribute(row.id).row, &row);
    }
    for (ViAttr id : ids)
        for (ViAttr near : {id - 1, id + 1, id + 1024, id ^ 0x80000000u})
            if (!ids.count(near)) {
                EXPECT_EQ(qn::capi::FindAttribute(near).row, nullptr) << near;
            }
    for (ViAttr id : {0u, 1u, 1000000u, 1050000u, 1150000u, 1250000u, 0xFFFFFFFFu})
        if (!ids.count(id)) {
            EXPECT_EQ(qn::capi::FindAttribute(id).row, nullptr) << id;
        }
}

}  // namespace
