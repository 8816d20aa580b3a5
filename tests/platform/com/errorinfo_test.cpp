// Per-thread error information.
#include "platform/com/errorinfo.h"

#include <gtest/gtest.h>

#include <thread>

namespace {

constexpr GUID kSource = MakeGuid("12345678-9abc-def0-1234-56789abcdef0");

TEST(ErrorInfo, SetAndTakeRoundTripsAndTakingClearsTheSlot) {
    ASSERT_EQ(qn::com::SetThreadError(kSource, "Src", "Grüße: failed", "help.txt", 42), S_OK);
    qn::com::ErrorRecord rec;
    ASSERT_TRUE(qn::com::TakeThreadError(&rec));
    EXPECT_EQ(rec.guid, kSource);
    EXPECT_EQ(rec.source, "Src");
    EXPECT_EQ(rec.description, "Grüße: failed");
    EXPECT_EQ(rec.help_file, "help.txt");
    EXPECT_EQ(rec.help_context, 42u);
    EXPECT_FALSE(qn::com::TakeThreadError(&rec));

    IErrorInfo* info = reinterpret_cast<IErrorInfo*>(1);
    EXPECT_EQ(GetErrorInfo(0, &info), S_FALSE);
    EXPECT_EQ(info, nullptr);
    EXPECT_EQ(GetErrorInfo(1, &info), E_INVALIDARG);
    EXPECT_EQ(GetErrorInfo(0, nullptr), E_INVALIDARG);
}

TEST(ErrorInfo, SlotIsPerThread) {
    ASSERT_EQ(qn::com::SetThreadError(kSource, "main", "on the main thread"), S_OK);
    bool other_saw_error = true;
    std::thread other([&] {
        other_saw_error = qn::com::TakeThreadError(nullptr);
        qn::com::SetThreadError(kSource, "other", "set and left on the other thread");
    });
    other.join();
    EXPECT_FALSE(other_saw_error);
    qn::com::ErrorRecord rec;
    ASSERT_TRUE(qn::com::TakeThreadError(&rec));
    EXPECT_EQ(rec.source, "main");
}

TEST(ErrorInfo, SetNullClearsAndObjectsAreCountedReferences) {
    ComPtr<ICreateErrorInfo> create;
    ASSERT_EQ(CreateErrorInfo(create.Out()), S_OK);
    create->SetDescription(u"direct");
    ComPtr<IErrorInfo> info;
    ASSERT_EQ(create.As(info), S_OK);
    ASSERT_EQ(SetErrorInfo(0, info.get()), S_OK);
    EXPECT_EQ(SetErrorInfo(7, info.get()), E_INVALIDARG);
    ASSERT_EQ(SetErrorInfo(0, nullptr), S_OK);
    EXPECT_FALSE(qn::com::TakeThreadError(nullptr));

    ASSERT_EQ(SetErrorInfo(0, info.get()), S_OK);
    ComPtr<IErrorInfo> taken;
    ASSERT_EQ(GetErrorInfo(0, taken.Out()), S_OK);
    EXPECT_EQ(taken.get(), info.get());
    qn::com::Bstr text;
    ASSERT_EQ(taken->GetDescription(text.Out()), S_OK);
    EXPECT_EQ(text.utf8(), "direct");
    EXPECT_EQ(taken->GetSource(nullptr), E_INVALIDARG);
    EXPECT_EQ(CreateErrorInfo(nullptr), E_INVALIDARG);
}

}  // namespace
