// What every attribute call looks up: the attribute by its ID, and the first
// name of the selector, trimmed, with every element of the list checked.
#include <gtest/gtest.h>

#include <set>

#include "Qn731XX.h"
#include "capi/attribute_table.h"
#include "capi/selector.h"
#include "core/root.h"
#include "platform/com/bstr.h"

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

// A session caches the channel items it resolves, but not once a client holds
// the driver object: that client may initialize it again, which makes new
// items with settings of their own.
TEST(AttributeLookup, ItemsAreNotTakenFromTheCacheOnceTheObjectIsHandedOut) {
    ViSession vi = 0;
    ASSERT_EQ(Qn731XX_InitWithOptions(const_cast<ViChar*>(""), VI_FALSE, VI_FALSE,
                                      "Simulate=true,DriverSetup=Model=QDS2014A", &vi),
              VI_SUCCESS);
    ViReal64 fresh = 0, range = 0;
    ASSERT_EQ(Qn731XX_GetAttributeViReal64(vi, "Channel4", IVISCOPE_ATTR_VERTICAL_RANGE, &fresh),
              VI_SUCCESS);
    ASSERT_EQ(Qn731XX_SetAttributeViReal64(vi, "Channel4", IVISCOPE_ATTR_VERTICAL_RANGE, fresh * 2),
              VI_SUCCESS);
    // A cached name found before parsing never lets a longer selector through.
    for (const char* bad : {"Channel4:x", "Channel4,", "Channel4[1]"})
        EXPECT_EQ(Qn731XX_GetAttributeViReal64(vi, bad, IVISCOPE_ATTR_VERTICAL_RANGE, &range),
                  IVI_ERROR_BADLY_FORMED_SELECTOR) << bad;
    for (const char* good : {" Channel4", "Channel4 ,Channel1"}) {
        EXPECT_EQ(Qn731XX_GetAttributeViReal64(vi, good, IVISCOPE_ATTR_VERTICAL_RANGE, &range),
                  VI_SUCCESS) << good;
        EXPECT_EQ(range, fresh * 2);
    }
    void* native = nullptr;
    ASSERT_EQ(Qn731XX_GetNativeIUnknownPtr(vi, &native), VI_SUCCESS);
    ComPtr<IUnknown> unknown(static_cast<IUnknown*>(native), false);
    ComPtr<IIviDriver> driver;
    ASSERT_EQ(unknown.As(driver), S_OK);
    ASSERT_EQ(driver->Close(), S_OK);
    qn::com::Bstr resource(""), options("Simulate=true,DriverSetup=Model=QDS2014A");
    ASSERT_EQ(driver->Initialize(resource.get(), VARIANT_FALSE, VARIANT_FALSE, options.get()), S_OK);
    EXPECT_EQ(Qn731XX_GetAttributeViReal64(vi, "Channel4", IVISCOPE_ATTR_VERTICAL_RANGE, &range),
              VI_SUCCESS);
    EXPECT_EQ(range, fresh);
    driver.reset();
    unknown.reset();
    EXPECT_EQ(Qn731XX_close(vi), VI_SUCCESS);
}

}  // namespace
