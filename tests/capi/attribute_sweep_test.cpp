// One sweep over every attribute of the C API in simulation: each names a
// property of the driver, the typed dispatch (right type works, every other
// type is refused, read-only refuses writes, the ViSession functions refuse
// every attribute), writes round-trip, and per-channel attributes need a
// channel name that exists.
#include <gtest/gtest.h>

#include <cmath>
#include <string>

#include "capi/attribute_table.h"
#include "capi/session_data.h"
#include "capi_fixture.h"

namespace qn::test {
namespace {

using capi::CType;
using capi::Scope;

const char* ChannelFor(Scope scope) {
    switch (scope) {
        case Scope::kChannel: return "Channel2";
        case Scope::kUserChannel: return "UserChannel2";
        case Scope::kDigitalChannel: return "UserDigitalChannel3";
        case Scope::kSession: break;
    }
    return "no such channel";  // ignored by attributes of the session
}

// Reads the attribute with the typed getter of `type`.
ViStatus Get(ViSession vi, const char* ch, ViAttr id, CType type) {
    ViInt32 i = 0;
    ViReal64 d = 0;
    ViBoolean b = 0;
    ViSession s = 0;
    char text[256];
    switch (type) {
        case CType::kInt32: return Qn731XX_GetAttributeViInt32(vi, ch, id, &i);
        case CType::kReal64: return Qn731XX_GetAttributeViReal64(vi, ch, id, &d);
        case CType::kBoolean: return Qn731XX_GetAttributeViBoolean(vi, ch, id, &b);
        case CType::kString: return Qn731XX_GetAttributeViString(vi, ch, id, sizeof text, text);
        case CType::kSession: return Qn731XX_GetAttributeViSession(vi, ch, id, &s);
    }
    return VI_SUCCESS;
}

// Writes a neutral value with the typed setter of `type`.
ViStatus Set(ViSession vi, const char* ch, ViAttr id, CType type) {
    switch (type) {
        case CType::kInt32: return Qn731XX_SetAttributeViInt32(vi, ch, id, 0);
        case CType::kReal64: return Qn731XX_SetAttributeViReal64(vi, ch, id, 0.0);
        case CType::kBoolean: return Qn731XX_SetAttributeViBoolean(vi, ch, id, VI_FALSE);
        case CType::kString: return Qn731XX_SetAttributeViString(vi, ch, id, "x");
        case CType::kSession: return Qn731XX_SetAttributeViSession(vi, ch, id, 0);
    }
    return VI_SUCCESS;
}

constexpr CType kTypes[] = {CType::kInt32, CType::kReal64, CType::kBoolean, CType::kString,
                            CType::kSession};

using AttributeSweep = CSessionTest;

TEST_F(AttributeSweep, EveryAttributeDispatchesByItsTypeAndAccess) {
    OpenSimulated();
    for (const capi::AttributeRow& row : capi::AttributeRows()) {
        SCOPED_TRACE(std::string(row.name));
        const capi::Attribute attr = capi::FindAttribute(row.id);
        ASSERT_EQ(attr.row, &row);
        ASSERT_NE(attr.property, nullptr) << row.key << " names no property";
        const CType type = attr.property->type;
        const char* ch = ChannelFor(row.scope);
        const ViStatus got = Get(vi_, ch, row.id, type);
        // A property the model lacks fails with the driver's own status.
        if (got < 0) {
            EXPECT_EQ(got, QN731XX_ERROR_MODEL_NOT_SUPPORTED);
            EXPECT_FALSE(RecordedError(vi_).empty());
        }
        for (CType other : kTypes) {
            if (other == type) continue;
            EXPECT_EQ(Get(vi_, ch, row.id, other), IVI_ERROR_TYPES_DO_NOT_MATCH);
            EXPECT_EQ(Set(vi_, ch, row.id, other), IVI_ERROR_TYPES_DO_NOT_MATCH);
        }
        if (!attr.property->put) {
            EXPECT_EQ(Set(vi_, ch, row.id, type), IVI_ERROR_ATTR_NOT_WRITABLE);
            EXPECT_EQ(RecordedError(vi_), "Attribute is read only.");
        }
        if (row.scope != Scope::kSession) {
            EXPECT_EQ(Get(vi_, "", row.id, type), IVI_ERROR_BADLY_FORMED_SELECTOR);
            EXPECT_EQ(Get(vi_, "Channel1,,Channel2", row.id, type), IVI_ERROR_BADLY_FORMED_SELECTOR);
            EXPECT_LT(Get(vi_, "NoSuchChannel", row.id, type), 0);
            EXPECT_FALSE(RecordedError(vi_).empty());
        }
    }
}

TEST_F(AttributeSweep, WritableNumbersAndBooleansReadBackWhatWasWritten) {
    OpenSimulated();
    for (const capi::AttributeRow& row : capi::AttributeRows()) {
        const capi::Attribute attr = capi::FindAttribute(row.id);
        if (!attr.property->put) continue;
        SCOPED_TRACE(std::string(row.name));
        const char* ch = ChannelFor(row.scope);
        switch (attr.property->type) {
            case CType::kReal64: {
                ViReal64 before = 0, after = 0;
                ASSERT_EQ(Qn731XX_GetAttributeViReal64(vi_, ch, row.id, &before), VI_SUCCESS);
                // A full-precision value different from the current one.
                const ViReal64 written = before + 0.12345678901234567;
                if (Qn731XX_SetAttributeViReal64(vi_, ch, row.id, written) != VI_SUCCESS) {
                    RecordedError(vi_);
                    break;  // refused by the property's own range check
                }
                ASSERT_EQ(Qn731XX_GetAttributeViReal64(vi_, ch, row.id, &after), VI_SUCCESS);
                EXPECT_EQ(after, written);
                break;
            }
            case CType::kBoolean: {
                ViBoolean before = 0, after = 0;
                ASSERT_EQ(Qn731XX_GetAttributeViBoolean(vi_, ch, row.id, &before), VI_SUCCESS);
                EXPECT_TRUE(before == VI_TRUE || before == VI_FALSE);
                if (row.id == IVI_ATTR_SIMULATE) continue;
                // Any nonzero value writes true.
                const ViBoolean written = before ? VI_FALSE : ViBoolean{0x100};
                const ViStatus set = Qn731XX_SetAttributeViBoolean(vi_, ch, row.id, written);
                if (set < 0) {
                    // Refused by the driver itself (not by the dispatch), with its text.
                    EXPECT_EQ(set, IVI_ERROR_VALUE_NOT_SUPPORTED);
                    EXPECT_FALSE(RecordedError(vi_).empty());
                    break;
                }
                ASSERT_EQ(Qn731XX_GetAttributeViBoolean(vi_, ch, row.id, &after), VI_SUCCESS);
                EXPECT_EQ(after, before ? VI_FALSE : VI_TRUE);
                break;
            }
            case CType::kInt32: {
                ViInt32 value = -1;
                if (Qn731XX_GetAttributeViInt32(vi_, ch, row.id, &value) != VI_SUCCESS) {
                    RecordedError(vi_);  // a property the model lacks, seen in the sweep above
                    break;
                }
                EXPECT_EQ(Qn731XX_SetAttributeViInt32(vi_, ch, row.id, value), VI_SUCCESS)
                    << RecordedError(vi_);
                break;
            }
            default: break;
        }
    }
}

TEST_F(AttributeSweep, UnknownIdsAndTheSessionTypeAreRefusedWithTheirTexts) {
    OpenSimulated();
    ViSession s = 7;
    EXPECT_EQ(Qn731XX_GetAttributeViSession(vi_, "", IVISCOPE_ATTR_VERTICAL_RANGE, &s),
              IVI_ERROR_TYPES_DO_NOT_MATCH);
    EXPECT_EQ(RecordedError(vi_), "Incorrect GetAttribute for attribute of this type.");
    EXPECT_EQ(Qn731XX_SetAttributeViReal64(vi_, "Channel1", IVISCOPE_ATTR_CHANNEL_ENABLED, 1.0),
              IVI_ERROR_TYPES_DO_NOT_MATCH);
    EXPECT_EQ(RecordedError(vi_), "Incorrect SetAttribute for attribute of this type.");
    for (ViAttr id : {ViAttr{0}, ViAttr{1250011}, ViAttr{1150610 + 1}, ViAttr{0xFFFFFFFF}}) {
        EXPECT_EQ(Qn731XX_GetAttributeViSession(vi_, "", id, &s), IVI_ERROR_INVALID_ATTRIBUTE);
        EXPECT_EQ(RecordedError(vi_), "Attribute not recognized.");
    }
    EXPECT_EQ(s, 7u);
    EXPECT_EQ(Qn731XX_SetAttributeViInt32(vi_, "", IVISCOPE_ATTR_HORZ_RECORD_LENGTH, 1000),
              IVI_ERROR_ATTR_NOT_WRITABLE);
}

TEST_F(AttributeSweep, ChannelAttributesReachTheChannelTheyName) {
    OpenSimulated();
    ASSERT_EQ(Qn731XX_SetAttributeViReal64(vi_, "Channel2", IVISCOPE_ATTR_VERTICAL_RANGE, 8.5),
              VI_SUCCESS);
    ASSERT_EQ(Qn731XX_SetAttributeViString(vi_, " UserChannel3 ", QN731XX_ATTR_CHANNEL_LABEL,
                                           "probe A"),
              VI_SUCCESS);
    ViReal64 r1 = 0, r2 = 0;
    EXPECT_EQ(Qn731XX_GetAttributeViReal64(vi_, "Channel1", IVISCOPE_ATTR_VERTICAL_RANGE, &r1), 0);
    EXPECT_EQ(Qn731XX_GetAttributeViReal64(vi_, "Channel2,Channel1", IVISCOPE_ATTR_VERTICAL_RANGE,
                                           &r2),
              0);
    EXPECT_NE(r1, 8.5);
    EXPECT_EQ(r2, 8.5);
    char label[8];
    EXPECT_EQ(Qn731XX_GetAttributeViString(vi_, "UserChannel3", QN731XX_ATTR_CHANNEL_LABEL,
                                           sizeof label, label),
              0);
    EXPECT_STREQ(label, "probe A");
    // Too small a buffer: the size needed and a truncated, terminated copy.
    EXPECT_EQ(Qn731XX_GetAttributeViString(vi_, "UserChannel3", QN731XX_ATTR_CHANNEL_LABEL, 4,
                                           label),
              8);
    EXPECT_STREQ(label, "pro");
    EXPECT_EQ(Qn731XX_GetAttributeViString(vi_, "UserChannel3", QN731XX_ATTR_CHANNEL_LABEL, 0,
                                           nullptr),
              8);
    EXPECT_EQ(Qn731XX_GetAttributeViString(vi_, "UserChannel3", QN731XX_ATTR_CHANNEL_LABEL, -1,
                                           label),
              IVI_ERROR_INVALID_VALUE);
    // The counts of the collections.
    ViInt32 n = 0;
    EXPECT_EQ(Qn731XX_GetAttributeViInt32(vi_, "", IVI_ATTR_CHANNEL_COUNT, &n), 0);
    EXPECT_EQ(n, 4);
    EXPECT_EQ(Qn731XX_GetAttributeViInt32(vi_, "", QN731XX_ATTR_DIGITALCHANNEL_COUNT, &n), 0);
    EXPECT_EQ(n, 16);
}

TEST_F(AttributeSweep, NullResultsAreRefusedBeforeAnythingIsRead) {
    OpenSimulated();
    EXPECT_EQ(Qn731XX_GetAttributeViInt32(vi_, "", IVI_ATTR_CHANNEL_COUNT, nullptr),
              QN731XX_ERROR_FAILURE);
    EXPECT_NE(RecordedError(vi_).find("value"), std::string::npos);
    EXPECT_EQ(Qn731XX_GetAttributeViReal64(vi_, "Channel1", IVISCOPE_ATTR_VERTICAL_RANGE, nullptr),
              QN731XX_ERROR_FAILURE);
    EXPECT_EQ(Qn731XX_GetAttributeViBoolean(vi_, "", IVI_ATTR_CACHE, nullptr),
              QN731XX_ERROR_FAILURE);
    // A string with a null buffer is the size query of the string rule.
    EXPECT_GT(Qn731XX_GetAttributeViString(vi_, "", IVI_ATTR_SUPPORTED_INSTRUMENT_MODELS, 0,
                                           nullptr),
              1);
}

TEST(AttributeWithoutSession, TheDriversIdentityAnswersOnSessionZero) {
    char text[256] = "";
    EXPECT_EQ(Qn731XX_GetAttributeViString(0, "", IVI_ATTR_SPECIFIC_DRIVER_VENDOR, sizeof text, text), 0);
    EXPECT_GT(std::string(text).size(), 0u);
    ViInt32 major = 0;
    EXPECT_EQ(Qn731XX_GetAttributeViInt32(0, "", IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION, &major), 0);
    EXPECT_GT(major, 0);
    // Anything else needs a session.
    EXPECT_EQ(Qn731XX_GetAttributeViString(0, "", IVI_ATTR_INSTRUMENT_MODEL, sizeof text, text),
              QN731XX_ERROR_INVALID_SESSION);
}


TEST(AttributeTable, EveryInterfaceOfTheAttributesHasASessionCacheSlot) {
    EXPECT_LE(capi::AttributeInterfaceCount(), capi::SessionData::kInterfaceSlots);
}

}  // namespace
}  // namespace qn::test
