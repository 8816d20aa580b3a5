#include <gtest/gtest.h>

#include <set>

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

TEST(ErrorTable, HasEveryMessageOnceWithMatchingSeverity) {
    auto table = ErrorTable();
    EXPECT_EQ(table.size(), 58u);
    std::set<std::uint32_t> ids;
    std::set<HRESULT> codes;
    for (const ErrorEntry& e : table) {
        EXPECT_TRUE(ids.insert(e.id).second) << e.name;
        EXPECT_TRUE(codes.insert(e.hr).second) << e.name;
        EXPECT_EQ(std::string_view(e.name).substr(0, 2) == "S_", SUCCEEDED(e.hr)) << e.name;
        EXPECT_EQ(FindErrorEntry(e.id), &e);
    }
    EXPECT_EQ(FindErrorEntry(Msg::E_QUORLEN731XX_WRAPPED_DRIVER_ERROR)->hr, HRESULT(0x80044218));
    EXPECT_EQ(FindErrorEntry(Msg::E_QUORLEN731XX_MAX_TIME_EXCEEDED)->hr, HRESULT(0x80044217));
    EXPECT_EQ(FindErrorEntry(3u), nullptr);
    EXPECT_EQ(FindErrorEntry(62u), nullptr);
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
    err.InvalidValue("M", "P", 1.0 / 3.0);
    EXPECT_EQ(TakeError().description,
              "Quorlen731XX: Invalid value (0.333333333333333) for method M, parameter P.");
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
