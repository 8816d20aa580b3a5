// The life of a C session: creation without registration, the error records
// of a session and of session 0, closing, invalid and closed handles, binding
// an existing driver object, and the session lock.
#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "capi_fixture.h"
#include "core/root.h"

namespace qn::test {
namespace {

using CSession = CSessionTest;

TEST_F(CSession, AnAddressWithoutAnInstrumentFailsAndRecordsForSessionZero) {
    ::setenv("QN_REGISTRY_FILE", "/nonexistent/registry", 1);  // no registration anywhere
    Qn731XX_ClearError(0);
    ViSession vi = 99;
    const ViStatus status = Qn731XX_InitWithOptions(
        const_cast<ViChar*>("TCPIP0::127.0.0.1::1::SOCKET"), VI_TRUE, VI_FALSE, "", &vi);
    EXPECT_LT(status, 0);
    EXPECT_EQ(vi, 0u);
    ViStatus code = 0;
    const std::string text = RecordedError(0, &code);
    EXPECT_EQ(code, status);
    EXPECT_NE(text.find("Quorlen731XX"), std::string::npos) << text;
}

TEST_F(CSession, ASessionKeepsItsOwnErrorRecord) {
    OpenSimulated();
    ViSession other = 0;
    ASSERT_EQ(Qn731XX_InitWithOptions(const_cast<ViChar*>(""), VI_FALSE, VI_FALSE,
                                      "Simulate=true", &other),
              VI_SUCCESS);
    EXPECT_NE(other, vi_);
    char name[32];
    EXPECT_EQ(Qn731XX_GetChannelName(vi_, 0, sizeof name, name), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(RecordedError(other), "");
    ViStatus code = 0;
    const std::string text = RecordedError(vi_, &code);
    EXPECT_EQ(code, IVI_ERROR_INVALID_VALUE);
    EXPECT_NE(text.find("get_Name"), std::string::npos) << text;
    // Reading the record cleared it.
    EXPECT_EQ(RecordedError(vi_, &code), "");
    EXPECT_EQ(code, VI_SUCCESS);
    EXPECT_EQ(Qn731XX_close(other), VI_SUCCESS);
}

TEST_F(CSession, AClosedOrUnknownHandleIsAnInvalidSession) {
    OpenSimulated();
    const ViSession vi = vi_;
    vi_ = 0;
    ASSERT_EQ(Qn731XX_close(vi), VI_SUCCESS);
    ViInt32 n = 0;
    char text[64];
    for (ViSession handle : {vi, ViSession{0}, ViSession{0x7FFFFFF0}}) {
        EXPECT_EQ(Qn731XX_close(handle), QN731XX_ERROR_INVALID_SESSION);
        EXPECT_EQ(Qn731XX_reset(handle), QN731XX_ERROR_INVALID_SESSION);
        EXPECT_EQ(Qn731XX_GetAttributeViInt32(handle, "", IVI_ATTR_CHANNEL_COUNT, &n),
                  QN731XX_ERROR_INVALID_SESSION);
        EXPECT_EQ(Qn731XX_GetChannelName(handle, 1, sizeof text, text), QN731XX_ERROR_INVALID_SESSION);
    }
}

TEST_F(CSession, NullSessionOutputsAreRefused) {
    EXPECT_EQ(Qn731XX_InitWithOptions(const_cast<ViChar*>(""), VI_FALSE, VI_FALSE, "Simulate=true",
                                      nullptr),
              QN731XX_ERROR_FAILURE);
    EXPECT_EQ(Qn731XX_init(nullptr, VI_FALSE, VI_FALSE, nullptr), QN731XX_ERROR_FAILURE);
    EXPECT_EQ(Qn731XX_AttachToExistingCOMSession(nullptr, nullptr), QN731XX_ERROR_FAILURE);
    ViSession vi = 5;
    EXPECT_EQ(Qn731XX_AttachToExistingCOMSession(nullptr, &vi), QN731XX_ERROR_FAILURE);
    EXPECT_EQ(vi, 0u);
}

TEST_F(CSession, AnExistingDriverObjectIsBoundWithOneReference) {
    ComPtr<Quorlen731XX> driver = com::MakeComObject<Quorlen731XX>();
    IUnknown* unknown = static_cast<IIviDriver*>(driver.get());
    ASSERT_EQ(Qn731XX_AttachToExistingCOMSession(unknown, &vi_), VI_SUCCESS);
    void* native = nullptr;
    ASSERT_EQ(Qn731XX_GetNativeIUnknownPtr(vi_, &native), VI_SUCCESS);
    ComPtr<IUnknown> back(static_cast<IUnknown*>(native), false);
    ComPtr<IUnknown> identity;
    ASSERT_EQ(driver->QueryInterface(iid_of<IUnknown>, identity.OutVoid()), S_OK);
    EXPECT_EQ(back.get(), identity.get());
    // The object is not initialized: members fail with the driver's status.
    EXPECT_EQ(Qn731XX_reset(vi_), IVI_ERROR_NOT_INITIALIZED);
    // The session holds its own reference: it outlives ours.
    back.reset();
    identity.reset();
    driver.reset();
    char name[32];
    EXPECT_EQ(Qn731XX_GetAttributeViString(vi_, "", IVI_ATTR_SPECIFIC_DRIVER_VENDOR, sizeof name, name),
              VI_SUCCESS);
    EXPECT_EQ(Qn731XX_GetNativeIUnknownPtr(vi_, nullptr), QN731XX_ERROR_FAILURE);
    // Closing an object that was never initialized reports it, and still ends the session.
    EXPECT_EQ(Qn731XX_close(vi_), IVI_ERROR_NOT_INITIALIZED);
    EXPECT_EQ(Qn731XX_close(vi_), QN731XX_ERROR_INVALID_SESSION);
    vi_ = 0;
}

// The root object behind a session's native IUnknown.
ComPtr<Quorlen731XX> RootOf(ViSession vi) {
    void* native = nullptr;
    EXPECT_EQ(Qn731XX_GetNativeIUnknownPtr(vi, &native), VI_SUCCESS);
    ComPtr<IUnknown> unknown(static_cast<IUnknown*>(native), false);
    ComPtr<IIviDriver> driver;
    EXPECT_EQ(unknown.As(driver), S_OK);
    return ComPtr<Quorlen731XX>(dynamic_cast<Quorlen731XX*>(driver.get()));
}

TEST_F(CSession, TheDriverObjectKnowsItsCSessionUntilTheSessionCloses) {
    OpenSimulated();
    ComPtr<Quorlen731XX> root = RootOf(vi_);
    ASSERT_TRUE(root);
    LONG handle = 0;
    EXPECT_EQ(root->get_NativeCHandle(&handle), S_OK);
    EXPECT_EQ(static_cast<ViSession>(handle), vi_);
    EXPECT_EQ(root->AttachToExistingCSession(), S_OK);

    // A second session on the same object takes the link; closing the first
    // does not take it from the second.
    ViSession second = 0;
    ASSERT_EQ(Qn731XX_AttachToExistingCOMSession(static_cast<IIviDriver*>(root.get()), &second),
              VI_SUCCESS);
    ASSERT_NE(second, vi_);
    EXPECT_EQ(root->get_NativeCHandle(&handle), S_OK);
    EXPECT_EQ(static_cast<ViSession>(handle), second);
    // Detaching the first session closes the object too; the link to the
    // second stays, and the second session still answers.
    EXPECT_EQ(Qn731XX_close(vi_), VI_SUCCESS);
    vi_ = 0;
    EXPECT_EQ(root->get_NativeCHandle(&handle), S_OK);
    EXPECT_EQ(static_cast<ViSession>(handle), second);

    EXPECT_EQ(Qn731XX_close(second), IVI_ERROR_NOT_INITIALIZED);
    handle = 7;
    EXPECT_EQ(root->get_NativeCHandle(&handle), E_IVI_PROPERTY_NOT_SUPPORTED);
    EXPECT_EQ(handle, 0);
    EXPECT_EQ(root->AttachToExistingCSession(), E_IVI_METHOD_NOT_SUPPORTED);
}

TEST_F(CSession, TheSessionLockIsHeldPerThreadAndReEntered) {
    OpenSimulated();
    ViBoolean has = VI_FALSE;
    EXPECT_EQ(Qn731XX_UnlockSession(vi_, nullptr), QN731XX_ERROR_SESSION_NOT_LOCKED);
    ASSERT_EQ(Qn731XX_LockSession(vi_, &has), VI_SUCCESS);
    EXPECT_EQ(has, VI_TRUE);
    ASSERT_EQ(Qn731XX_LockSession(vi_, nullptr), VI_SUCCESS);
    std::thread other([&] { EXPECT_EQ(Qn731XX_UnlockSession(vi_, nullptr), QN731XX_ERROR_SESSION_NOT_LOCKED); });
    other.join();
    EXPECT_EQ(Qn731XX_UnlockSession(vi_, nullptr), VI_SUCCESS);
    EXPECT_EQ(Qn731XX_UnlockSession(vi_, &has), VI_SUCCESS);
    EXPECT_EQ(has, VI_FALSE);
    EXPECT_EQ(Qn731XX_UnlockSession(vi_, nullptr), QN731XX_ERROR_SESSION_NOT_LOCKED);
}

TEST_F(CSession, InherentQueriesCopyTheirTextsInSimulation) {
    OpenSimulated();
    char driver_rev[256] = "", instr_rev[256] = "";
    EXPECT_EQ(Qn731XX_revision_query(vi_, driver_rev, instr_rev), VI_SUCCESS);
    EXPECT_GT(std::string(driver_rev).size(), 0u);
    ViInt16 result = -1;
    char message[1024] = "";
    EXPECT_EQ(Qn731XX_self_test(vi_, &result, message), VI_SUCCESS);
    EXPECT_EQ(result, 0);
    ViInt32 code = -1;
    EXPECT_EQ(Qn731XX_error_query(vi_, &code, message), VI_SUCCESS);
    EXPECT_EQ(code, 0);
    EXPECT_EQ(Qn731XX_error_query(vi_, nullptr, message), QN731XX_ERROR_FAILURE);
    EXPECT_EQ(Qn731XX_self_test(vi_, &result, nullptr), QN731XX_ERROR_FAILURE);
    EXPECT_EQ(Qn731XX_revision_query(vi_, nullptr, instr_rev), QN731XX_ERROR_FAILURE);
    char name[32];
    EXPECT_EQ(Qn731XX_GetChannelName(vi_, 2, sizeof name, name), VI_SUCCESS);
    EXPECT_STREQ(name, "Channel2");
    EXPECT_EQ(Qn731XX_GetDigitalChannelName(vi_, 1, sizeof name, name), VI_SUCCESS);
    EXPECT_STREQ(name, "UserDigitalChannel0");
    EXPECT_LT(Qn731XX_GetChannelName(vi_, 0, sizeof name, name), 0);
    EXPECT_LT(Qn731XX_GetChannelName(vi_, 5, sizeof name, name), 0);
}


TEST_F(CSession, WaveformsFillNoMoreThanTheCallersArray) {
    OpenSimulated("QDS2014A");  // simulated records have 100 points
    struct Case {
        ViInt32 size;
        ViInt32 actual;
    };
    for (Case c : {Case{10, 10}, Case{1, 1}, Case{0, 0}, Case{100, 100}, Case{150, 100}}) {
        SCOPED_TRACE(c.size);
        std::vector<ViReal64> array(static_cast<std::size_t>(c.size) + 4, -7.0);
        ViInt32 actual = -1;
        ViReal64 x0 = 0.25, dx = 0.5;
        EXPECT_EQ(Qn731XX_FetchWaveform(vi_, "Channel1", c.size, array.data(), &actual, &x0, &dx),
                  VI_SUCCESS)
            << RecordedError(vi_);
        EXPECT_EQ(actual, c.actual);
        for (std::size_t i = static_cast<std::size_t>(c.actual); i < array.size(); ++i)
            EXPECT_EQ(array[i], -7.0) << i;
        std::vector<ViReal64> min(array.size(), -7.0), max(array.size(), -7.0);
        EXPECT_EQ(Qn731XX_ReadMinMaxWaveform(vi_, "Channel1", 1000, c.size, min.data(), max.data(),
                                             &actual, &x0, &dx),
                  VI_SUCCESS);
        EXPECT_LE(actual, c.size);
        EXPECT_EQ(min[static_cast<std::size_t>(c.size)], -7.0);
        EXPECT_EQ(max[static_cast<std::size_t>(c.size)], -7.0);
    }
    ViReal64 one[1];
    ViInt32 actual = 0;
    ViReal64 x0 = 0, dx = 0;
    EXPECT_EQ(Qn731XX_FetchWaveform(vi_, "Channel1", -1, one, &actual, &x0, &dx),
              IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(Qn731XX_FetchWaveform(vi_, "Channel1", 1, nullptr, &actual, &x0, &dx),
              QN731XX_ERROR_FAILURE);
    EXPECT_EQ(Qn731XX_FetchWaveform(vi_, "Channel1", 1, one, nullptr, &x0, &dx),
              QN731XX_ERROR_FAILURE);
    EXPECT_EQ(Qn731XX_FetchWaveform(vi_, "Channel1", 1, one, &actual, &x0, nullptr),
              QN731XX_ERROR_FAILURE);
    EXPECT_EQ(Qn731XX_FetchWaveform(vi_, "", 1, one, &actual, &x0, &dx),
              IVI_ERROR_BADLY_FORMED_SELECTOR);
    EXPECT_LT(Qn731XX_FetchWaveform(vi_, "Channel9", 1, one, &actual, &x0, &dx), 0);
}


TEST_F(CSession, ARecordTooLongForTheBufferIsDeliveredByTheNextCall) {
    ComPtr<Quorlen731XX> driver = com::MakeComObject<Quorlen731XX>();
    com::Bstr r(""), o("Simulate=true,RecordCoercions=true");
    ASSERT_EQ(driver->Initialize(r.get(), VARIANT_FALSE, VARIANT_FALSE, o.get()), S_OK);
    driver->Core().coercions.AddCoercionRecord("first record");
    driver->Core().coercions.AddCoercionRecord("second record");
    ASSERT_EQ(Qn731XX_AttachToExistingCOMSession(static_cast<IIviDriver*>(driver.get()), &vi_), 0);
    char text[32];
    // The size first, then the same record; a buffer one short keeps it too.
    EXPECT_EQ(Qn731XX_GetNextCoercionRecord(vi_, 0, nullptr), 13);
    EXPECT_EQ(Qn731XX_GetNextCoercionRecord(vi_, 12, text), 13);
    EXPECT_STREQ(text, "first recor");
    EXPECT_EQ(Qn731XX_GetNextCoercionRecord(vi_, sizeof text, text), VI_SUCCESS);
    EXPECT_STREQ(text, "first record");
    EXPECT_EQ(Qn731XX_GetNextCoercionRecord(vi_, sizeof text, text), VI_SUCCESS);
    EXPECT_STREQ(text, "second record");
    EXPECT_EQ(Qn731XX_GetNextCoercionRecord(vi_, sizeof text, text), VI_SUCCESS);
    EXPECT_STREQ(text, "");
}

}  // namespace
}  // namespace qn::test
