// The conversion of result codes into C statuses against the header's
// constants, the fallback for codes without a row, the string rule and the
// message texts of Qn731XX_error_message.
#include <gtest/gtest.h>

#include <cstring>
#include <set>

#include "Qn731XX.h"
#include "Quorlen731XXErrors.h"
#include "capi/c_session.h"
#include "capi/status_table.h"
#include "core/error_table.h"

namespace qn::capi {
namespace {

struct Row {
    HRESULT hr;
    ViStatus c;
};

// Every code of the driver's message table with the header constant it becomes.
const Row kRows[] = {
    {E_QUORLEN731XX_IO_GENERAL, QN731XX_ERROR_IO_GENERAL},
    {E_QUORLEN731XX_IO_TIMEOUT, QN731XX_ERROR_IO_TIMEOUT},
    {E_QUORLEN731XX_MODEL_NOT_SUPPORTED, QN731XX_ERROR_MODEL_NOT_SUPPORTED},
    {E_QUORLEN731XX_WRAPPED_DRIVER_ERROR, QN731XX_ERROR_WRAPPED_DRIVER_ERROR},
    {E_QUORLEN731XX_MAX_TIME_EXCEEDED, QN731XX_ERROR_MAX_TIME_EXCEEDED},
    {E_QUORLEN731XX_MEAS_CONFIG_ERROR, QN731XX_ERROR_MEAS_CONFIG_ERROR},
    {E_QUORLEN731XX_INVALID_WAVEFORM_ELEMENT, QN731XX_ERROR_INVALID_WAVEFORM_ELEMENT},
    {E_QUORLEN731XX_PROPERTY_NOT_SUPPORTED, QN731XX_ERROR_PROPERTY_NOT_SUPPORTED},
    {E_QUORLEN731XX_SETTINGS_CONFLICT, QN731XX_ERROR_SETTINGS_CONFLICT},
    {E_QUORLEN731XX_UNKNOWN_SOURCE, QN731XX_ERROR_UNKNOWN_SOURCE},
    {E_QUORLEN731XX_CHANNEL_COUPLING, QN731XX_ERROR_CHANNEL_COUPLING},
    {E_QUORLEN731XX_VERTICAL_GROUND_COUPLING, QN731XX_ERROR_VERTICAL_GROUND_COUPLING},
    {S_IVI_SUCCESS, VI_SUCCESS},
    {S_IVI_NSUP_ID_QUERY, IVI_WARN_NSUP_ID_QUERY},
    {S_IVI_NSUP_RESET, IVI_WARN_NSUP_RESET},
    {S_IVI_NSUP_SELF_TEST, IVI_WARN_NSUP_SELF_TEST},
    {S_IVI_NSUP_ERROR_QUERY, IVI_WARN_NSUP_ERROR_QUERY},
    {S_IVI_NSUP_REV_QUERY, IVI_WARN_NSUP_REV_QUERY},
    {E_IVI_CANNOT_RECOVER, IVI_ERROR_CANNOT_RECOVER},
    {E_IVI_INSTRUMENT_STATUS, IVI_ERROR_INSTRUMENT_STATUS},
    {E_IVI_CANNOT_OPEN_FILE, IVI_ERROR_CANNOT_OPEN_FILE},
    {E_IVI_READING_FILE, IVI_ERROR_READING_FILE},
    {E_IVI_WRITING_FILE, IVI_ERROR_WRITING_FILE},
    {E_IVI_INVALID_PATHNAME, IVI_ERROR_INVALID_PATHNAME},
    {E_IVI_INVALID_VALUE, IVI_ERROR_INVALID_VALUE},
    {E_IVI_METHOD_NOT_SUPPORTED, IVI_ERROR_FUNCTION_NOT_SUPPORTED},
    {E_IVI_PROPERTY_NOT_SUPPORTED, IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED},
    {E_IVI_VALUE_NOT_SUPPORTED, IVI_ERROR_VALUE_NOT_SUPPORTED},
    {E_IVI_NOT_INITIALIZED, IVI_ERROR_NOT_INITIALIZED},
    {E_IVI_UNKNOWN_CHANNEL_NAME, IVI_ERROR_UNKNOWN_CHANNEL_NAME},
    {E_IVI_TOO_MANY_OPEN_FILES, IVI_ERROR_TOO_MANY_OPEN_FILES},
    {E_IVI_CHANNEL_NAME_REQUIRED, IVI_ERROR_CHANNEL_NAME_REQUIRED},
    {E_IVI_MISSING_OPTION_NAME, IVI_ERROR_MISSING_OPTION_NAME},
    {E_IVI_MISSING_OPTION_VALUE, IVI_ERROR_MISSING_OPTION_VALUE},
    {E_IVI_BAD_OPTION_NAME, IVI_ERROR_BAD_OPTION_NAME},
    {E_IVI_BAD_OPTION_VALUE, IVI_ERROR_BAD_OPTION_VALUE},
    {E_IVI_OUT_OF_MEMORY, IVI_ERROR_OUT_OF_MEMORY},
    {E_IVI_OPERATION_PENDING, IVI_ERROR_OPERATION_PENDING},
    {E_IVI_NULL_POINTER, IVI_ERROR_NULL_POINTER},
    {E_IVI_UNEXPECTED_RESPONSE, IVI_ERROR_UNEXPECTED_RESPONSE},
    {E_IVI_FILE_NOT_FOUND, IVI_ERROR_FILE_NOT_FOUND},
    {E_IVI_INVALID_FILE_FORMAT, IVI_ERROR_INVALID_FILE_FORMAT},
    {E_IVI_STATUS_NOT_AVAILABLE, IVI_ERROR_STATUS_NOT_AVAILABLE},
    {E_IVI_ID_QUERY_FAILED, IVI_ERROR_ID_QUERY_FAILED},
    {E_IVI_RESET_FAILED, IVI_ERROR_RESET_FAILED},
    {E_IVI_RESOURCE_UNKNOWN, IVI_ERROR_RESOURCE_UNKNOWN},
    {E_IVI_ALREADY_INITIALIZED, IVI_ERROR_ALREADY_INITIALIZED},
    {E_IVI_CANNOT_CHANGE_SIMULATION_STATE, IVI_ERROR_CANNOT_CHANGE_SIMULATION_STATE},
    {E_IVI_INVALID_NUMBER_OF_LEVELS_IN_SELECTOR, IVI_ERROR_INVALID_NUMBER_OF_LEVELS_IN_SELECTOR},
    {E_IVI_INVALID_RANGE_IN_SELECTOR, IVI_ERROR_INVALID_RANGE_IN_SELECTOR},
    {E_IVI_UNKNOWN_NAME_IN_SELECTOR, IVI_ERROR_UNKNOWN_NAME_IN_SELECTOR},
    {E_IVI_BADLY_FORMED_SELECTOR, IVI_ERROR_BADLY_FORMED_SELECTOR},
    {E_IVI_UNKNOWN_PHYSICAL_IDENTIFIER, IVI_ERROR_UNKNOWN_PHYSICAL_IDENTIFIER},
    {S_IVISCOPE_INVALID_WFM_ELEMENT, IVISCOPE_WARN_INVALID_WFM_ELEMENT},
    {E_IVISCOPE_CHANNEL_NOT_ENABLED, IVISCOPE_ERROR_CHANNEL_NOT_ENABLED},
    {E_IVISCOPE_UNABLE_TO_PERFORM_MEASUREMENT, IVISCOPE_ERROR_UNABLE_TO_PERFORM_MEASUREMENT},
    {E_IVISCOPE_MAX_TIME_EXCEEDED, IVISCOPE_ERROR_MAX_TIME_EXCEEDED},
    {E_IVISCOPE_INVALID_ACQ_TYPE, IVISCOPE_ERROR_INVALID_ACQ_TYPE},
};

TEST(StatusConversion, EveryRowOfTheMessageTableBecomesItsHeaderConstant) {
    std::set<HRESULT> covered;
    for (const Row& r : kRows) {
        EXPECT_EQ(static_cast<std::uint32_t>(ToCStatus(r.hr)), static_cast<std::uint32_t>(r.c))
            << std::hex << r.hr;
        covered.insert(r.hr);
    }
    for (const ErrorEntry& e : ErrorTable()) EXPECT_TRUE(covered.count(e.hr)) << e.name;
    // The pinned examples.
    EXPECT_EQ(static_cast<std::uint32_t>(ToCStatus(E_QUORLEN731XX_MODEL_NOT_SUPPORTED)), 0xBFFA4216u);
    EXPECT_EQ(static_cast<std::uint32_t>(ToCStatus(E_IVI_INVALID_VALUE)), 0xBFFA0010u);
}

TEST(StatusConversion, CodesWithoutARowBecomeTheGenericFailureOrSuccess) {
    const std::pair<std::uint32_t, std::uint32_t> cases[] = {
        {0x80004005u, 0x80000000u},  // E_FAIL
        {0x80047068u, 0x80000000u},  // next to the inherent rows, but not one of them
        {0x80044000u, 0x80000000u},
        {0x8004421Au, 0x80000000u},
        {0xFFFFFFFFu, 0x80000000u},
        {0x00000001u, 0u},           // S_FALSE
        {0x00047064u, 0u},           // below the first inherent warning
        {0x00042002u, 0u},
    };
    for (auto [hr, c] : cases)
        EXPECT_EQ(static_cast<std::uint32_t>(ToCStatus(static_cast<HRESULT>(hr))), c) << std::hex << hr;
}

TEST(StringRule, FillsTruncatesAndReportsTheSizeNeeded) {
    struct Case {
        const char* text;
        ViInt32 size;
        bool buffer;
        ViStatus status;
        const char* written;  // null: nothing written
    };
    const Case cases[] = {
        {"abc", 4, true, 0, "abc"},    // exactly fills, terminator included
        {"abc", 5, true, 0, "abc"},
        {"abc", 3, true, 4, "ab"},     // one character short
        {"abc", 1, true, 4, ""},
        {"abc", 0, true, 4, nullptr},  // size 0 writes nothing
        {"abc", 8, false, 4, nullptr}, // no buffer
        {"", 1, true, 0, ""},
        {"", 0, false, 1, nullptr},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.text) + " size " + std::to_string(c.size));
        char buf[16];
        std::memset(buf, '#', sizeof buf);
        EXPECT_EQ(CopyString(0, c.text, c.size, c.buffer ? buf : nullptr), c.status);
        if (c.written) {
            EXPECT_STREQ(buf, c.written);
            // Nothing beyond the caller's size was touched.
            for (std::size_t i = static_cast<std::size_t>(c.size); i < sizeof buf; ++i)
                EXPECT_EQ(buf[i], '#') << i;
        } else {
            EXPECT_EQ(buf[0], '#');
        }
    }
    // A null text is an empty one.
    char one[1] = {'#'};
    EXPECT_EQ(CopyString(0, BSTR{nullptr}, 1, one), 0);
    EXPECT_EQ(one[0], '\0');
    EXPECT_EQ(CopyString(0, BSTR{nullptr}, 0, nullptr), 1);
    // A negative size is refused and recorded; nothing is written.
    char buf[4] = {'#', '#', '#', '#'};
    EXPECT_EQ(CopyString(0, "abc", -1, buf), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(buf[0], '#');
}

TEST(ErrorMessage, GivesTheDriversTextsWithoutThePrefix) {
    const std::pair<ViStatus, const char*> cases[] = {
        {QN731XX_ERROR_MODEL_NOT_SUPPORTED, "Instrument model does not support this feature: %1."},
        {IVI_ERROR_INVALID_VALUE, "Invalid value (%1) for method %2, parameter %3."},
        {IVISCOPE_WARN_INVALID_WFM_ELEMENT, "One of the elements in the waveform array is invalid."},
        {IVI_WARN_NSUP_RESET, "Reset is not supported by this instrument."},
        {IVI_ERROR_INVALID_ATTRIBUTE, "Attribute not recognized."},
        {IVI_ERROR_ATTR_NOT_WRITABLE, "Attribute is read only."},
        {QN731XX_ERROR_INVALID_SESSION, "The given session or object reference is invalid."},
        {static_cast<ViStatus>(0xBFFF0015u), "Timeout expired before operation completed."},
    };
    for (auto [status, text] : cases) {
        char buf[256] = "unchanged";
        EXPECT_EQ(Qn731XX_error_message(0, status, buf), VI_SUCCESS);
        EXPECT_STREQ(buf, text) << std::hex << status;
    }
    // A status without a text leaves the buffer as it was.
    for (ViStatus status : {static_cast<ViStatus>(0xBFFA7777u), ViStatus{12345}}) {
        char buf[256] = "unchanged";
        EXPECT_EQ(Qn731XX_error_message(0, status, buf), VI_SUCCESS);
        EXPECT_STREQ(buf, "unchanged");
    }
    EXPECT_EQ(Qn731XX_error_message(0, IVI_ERROR_INVALID_VALUE, nullptr), VI_SUCCESS);
}

}  // namespace
}  // namespace qn::capi
