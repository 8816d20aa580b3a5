#include <gtest/gtest.h>

#include <iterator>

#include "Quorlen731XXErrors.h"
#include "core/error_manager.h"
#include "platform/com/errorinfo.h"

namespace qn {
namespace {

com::ErrorRecord TakeError() {
    com::ErrorRecord rec;
    EXPECT_TRUE(com::TakeThreadError(&rec));
    return rec;
}

// The message table as documented: number, code name, HRESULT and the text
// after the prefix, with the inserts "<1>", "<2>", "<3>" filled in.
struct DocumentedMessage {
    std::uint32_t id;
    const char* name;
    std::uint32_t hr;
    const char* text;
};
constexpr DocumentedMessage kDocumented[] = {
    {4, "E_QUORLEN731XX_IO_GENERAL", 0x80044214, "IO error: <1>."},
    {5, "E_QUORLEN731XX_IO_TIMEOUT", 0x80044215, "IO timeout error: <1>."},
    {6, "E_QUORLEN731XX_MODEL_NOT_SUPPORTED", 0x80044216, "Instrument model does not support this feature: <1>."},
    {7, "E_QUORLEN731XX_WRAPPED_DRIVER_ERROR", 0x80044218, "Error in call to wrapped driver: ViStatus = <1>."},
    {8, "E_QUORLEN731XX_MAX_TIME_EXCEEDED", 0x80044217, "<1> Max time exceeded."},
    {9, "E_QUORLEN731XX_MEAS_CONFIG_ERROR", 0x80044219, "Measurement configuration error: %s"},
    {10, "E_QUORLEN731XX_INVALID_WAVEFORM_ELEMENT", 0x8004421B, "At least one element in the retrieved waveform was invalid."},
    {11, "E_QUORLEN731XX_PROPERTY_NOT_SUPPORTED", 0x80044001, "Property is not supported."},
    {12, "E_QUORLEN731XX_SETTINGS_CONFLICT", 0x80044002, "Settings Conflict."},
    {13, "E_QUORLEN731XX_UNKNOWN_SOURCE", 0x80044003, "Unknown source name."},
    {14, "E_QUORLEN731XX_CHANNEL_COUPLING", 0x80044004, "Quorlen731XXVerticalCouplingGnd passed as the value for property put_Coupling."},
    {15, "E_QUORLEN731XX_VERTICAL_GROUND_COUPLING", 0x80044005, "Does not support this class-compliant feature: (enumeration) value Quorlen731XXVerticalCouplingGnd passed as the value for property put_Coupling."},
    {16, "S_IVI_SUCCESS", 0x00000000, "Success."},
    {17, "S_IVI_NSUP_ID_QUERY", 0x00047065, "ID Query is not supported by this instrument."},
    {18, "S_IVI_NSUP_RESET", 0x00047066, "Reset is not supported by this instrument."},
    {19, "S_IVI_NSUP_SELF_TEST", 0x00047067, "Self test is not supported by this instrument."},
    {20, "S_IVI_NSUP_ERROR_QUERY", 0x00047068, "Error query is not supported by this instrument."},
    {21, "S_IVI_NSUP_REV_QUERY", 0x00047069, "Firmware revision query is not supported by this instrument."},
    {22, "E_IVI_CANNOT_RECOVER", 0x80047000, "Failure cannot recover."},
    {23, "E_IVI_INSTRUMENT_STATUS", 0x80047001, "Instrument error detected.  Use ErrorQuery() to determine the error(s)."},
    {24, "E_IVI_CANNOT_OPEN_FILE", 0x80047002, "Cannot open file."},
    {25, "E_IVI_READING_FILE", 0x80047003, "Error reading file."},
    {26, "E_IVI_WRITING_FILE", 0x80047004, "Error writing file."},
    {27, "E_IVI_INVALID_PATHNAME", 0x8004700B, "The pathname is invalid."},
    {28, "E_IVI_INVALID_VALUE", 0x80047010, "Invalid value (<1>) for method <2>, parameter <3>."},
    {29, "E_IVI_METHOD_NOT_SUPPORTED", 0x80047011, "Does not support this class-compliant feature: method <1>"},
    {30, "E_IVI_PROPERTY_NOT_SUPPORTED", 0x80047012, "Does not support this class-compliant feature: property <1>."},
    {31, "E_IVI_VALUE_NOT_SUPPORTED", 0x80047013, "Does not support this class-compliant feature:  (enumeration) value <1> passed as the value for parameter <2> in method <3>."},
    {32, "E_IVI_NOT_INITIALIZED", 0x8004701D, "A connection to the instrument has not been established."},
    {33, "E_IVI_UNKNOWN_CHANNEL_NAME", 0x80047020, "Unknown channel name."},
    {34, "E_IVI_TOO_MANY_OPEN_FILES", 0x80047023, "Too many files are open."},
    {35, "E_IVI_CHANNEL_NAME_REQUIRED", 0x80047044, "A channel name is required."},
    {36, "E_IVI_MISSING_OPTION_NAME", 0x80047049, "The option string is missing an option name."},
    {37, "E_IVI_MISSING_OPTION_VALUE", 0x8004704A, "The option string is missing an option value."},
    {38, "E_IVI_BAD_OPTION_NAME", 0x8004704B, "The <1> name in the option string is unknown."},
    {39, "E_IVI_BAD_OPTION_VALUE", 0x8004704C, "The <1> value in the option string is unknown."},
    {40, "E_IVI_OUT_OF_MEMORY", 0x80047056, "Could not allocate necessary memory."},
    {41, "E_IVI_OPERATION_PENDING", 0x80047057, "Operation in progress."},
    {42, "E_IVI_NULL_POINTER", 0x80047058, "Null pointer passed for method <1>, parameter <2>."},
    {43, "E_IVI_UNEXPECTED_RESPONSE", 0x80047059, "Unexpected response from instrument."},
    {44, "E_IVI_FILE_NOT_FOUND", 0x8004705B, "File not found."},
    {45, "E_IVI_INVALID_FILE_FORMAT", 0x8004705C, "Invalid file format."},
    {46, "E_IVI_STATUS_NOT_AVAILABLE", 0x8004705D, "The instrument status is not available."},
    {47, "E_IVI_ID_QUERY_FAILED", 0x8004705E, "Instrument ID query failed."},
    {48, "E_IVI_RESET_FAILED", 0x8004705F, "Instrument reset failed."},
    {49, "E_IVI_RESOURCE_UNKNOWN", 0x80047060, "Unknown resource."},
    {50, "E_IVI_ALREADY_INITIALIZED", 0x80047061, "The driver is already initialized."},
    {51, "E_IVI_CANNOT_CHANGE_SIMULATION_STATE", 0x80047062, "The simulation state cannot be changed."},
    {52, "E_IVI_INVALID_NUMBER_OF_LEVELS_IN_SELECTOR", 0x80047063, "The number of levels in the selector is not valid for the <1> repeated capability."},
    {53, "E_IVI_INVALID_RANGE_IN_SELECTOR", 0x80047064, "The range <1> is not valid for the repeated capability <2>."},
    {54, "E_IVI_UNKNOWN_NAME_IN_SELECTOR", 0x80047065, "Unknown name in selector."},
    {55, "E_IVI_BADLY_FORMED_SELECTOR", 0x80047066, "The repeated capability selector is badly-formed."},
    {56, "E_IVI_UNKNOWN_PHYSICAL_IDENTIFIER", 0x80047067, "Unknown physical repeated capability selector."},
    {57, "S_IVISCOPE_INVALID_WFM_ELEMENT", 0x00042001, "One of the elements in the waveform array is invalid."},
    {58, "E_IVISCOPE_CHANNEL_NOT_ENABLED", 0x80042001, "Specified channel is not enabled."},
    {59, "E_IVISCOPE_UNABLE_TO_PERFORM_MEASUREMENT", 0x80042002, "Unable to perform desired measurement operation."},
    {60, "E_IVISCOPE_MAX_TIME_EXCEEDED", 0x80042003, "Maximum time exceeded before the operation completed."},
    {61, "E_IVISCOPE_INVALID_ACQ_TYPE", 0x80042004, "Invalid acquisition type."},
};

TEST(ErrorTable, EveryMessageReportsItsDocumentedCodeAndText) {
    EXPECT_EQ(ErrorTable().size(), std::size(kDocumented));
    CErrorManagerBase err;
    for (const DocumentedMessage& d : kDocumented) {
        SCOPED_TRACE(d.name);
        const ErrorEntry* e = FindErrorEntry(d.id);
        ASSERT_NE(e, nullptr);
        EXPECT_STREQ(e->name, d.name);
        EXPECT_EQ(static_cast<std::uint32_t>(err.Error(static_cast<Msg>(d.id), {"<1>", "<2>", "<3>"})),
                  d.hr);
        EXPECT_EQ(TakeError().description, std::string("Quorlen731XX: ") + d.text);
    }
    for (std::uint32_t id : {0u, 3u, 62u}) EXPECT_EQ(FindErrorEntry(id), nullptr) << id;
}

TEST(ErrorManager, FormatsInsertsInOrderWithPrefix) {
    CErrorManagerBase err;
    constexpr GUID kIid = MakeGuid("01234567-89ab-cdef-0123-456789abcdef");
    err.SetErrorIid(kIid);
    EXPECT_EQ(err.InvalidValue("M", "P", std::int32_t{7}), E_IVI_INVALID_VALUE);
    com::ErrorRecord rec = TakeError();
    EXPECT_EQ(rec.description, "Quorlen731XX: Invalid value (7) for method M, parameter P.");
    EXPECT_EQ(rec.source, "Quorlen731XX.Quorlen731XX.1");
    EXPECT_EQ(rec.guid, kIid);
    EXPECT_EQ(rec.help_context, 0u);
    EXPECT_EQ(rec.help_file, "");

    err.InvalidValue("M", "P", 0.1);
    EXPECT_EQ(TakeError().description, "Quorlen731XX: Invalid value (0.1) for method M, parameter P.");
    err.InvalidValue("M", "P", -1.2345678901234567e-5);
    EXPECT_EQ(TakeError().description,
              "Quorlen731XX: Invalid value (-1.23456789012346e-05) for method M, parameter P.");
    err.InvalidValue("M", "P", std::int8_t{-3});
    EXPECT_EQ(TakeError().description, "Quorlen731XX: Invalid value (-3) for method M, parameter P.");
    com::Bstr b(std::string_view("\xC3\xA9t\xC3\xA9"));
    err.InvalidValueBstr("M", "P", b.get());
    EXPECT_EQ(TakeError().description,
              "Quorlen731XX: Invalid value (\xC3\xA9t\xC3\xA9) for method M, parameter P.");
}

TEST(ErrorManager, ExtraTextFollowsAfterCrLf) {
    CErrorManagerBase err;
    EXPECT_EQ(err.ErrorWithExtra(Msg::E_IVI_ID_QUERY_FAILED, "Unrecognized model: X."),
              E_IVI_ID_QUERY_FAILED);
    EXPECT_EQ(TakeError().description,
              "Quorlen731XX: Instrument ID query failed.\r\nUnrecognized model: X.");
    // Missing inserts read as empty; only the ends of the whole text are trimmed.
    err.Error(Msg::E_QUORLEN731XX_MAX_TIME_EXCEEDED);
    EXPECT_EQ(TakeError().description, "Quorlen731XX:  Max time exceeded.");
}

TEST(ErrorManager, WarningsSucceedAndStillCarryErrorInformation) {
    CErrorManagerBase err;
    HRESULT hr = err.Error(Msg::S_IVISCOPE_INVALID_WFM_ELEMENT);
    EXPECT_EQ(hr, HRESULT(0x00042001));
    EXPECT_TRUE(SUCCEEDED(hr));
    EXPECT_EQ(TakeError().description,
              "Quorlen731XX: One of the elements in the waveform array is invalid.");
}

TEST(ErrorManager, UnknownMessageTakesTheInternalErrorPath) {
    CErrorManagerBase err;
    const std::uint32_t kNoSuchMessage = 999;
    HRESULT hr = err.Error(static_cast<Msg>(kNoSuchMessage));
    EXPECT_EQ(hr, DISP_E_EXCEPTION);
    std::string d = TakeError().description;
    EXPECT_EQ(d.rfind("Internal Error: Unable to retrieve and format error message from message "
                      "table.\nResource ID = 999\nLanguage ID = 0\nReason = '",
                      0),
              0u)
        << d;
}

}  // namespace
}  // namespace qn
