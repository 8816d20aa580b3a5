// Helpers shared by the session and formatted-I/O tests.
#pragma once

#include <gtest/gtest.h>

#include <string>

#include "platform/com/errorinfo.h"
#include "platform/visa/visa.h"

namespace qn::visa::test {

// Opens a session on resource, with the line-feed termination character
// enabled as the driver configures socket sessions.
inline ComPtr<IMessage> OpenMessage(const std::string& resource, LONG timeout_ms = 2000) {
    ComPtr<IResourceManager> rm;
    EXPECT_EQ(CreateResourceManager(rm.Out()), S_OK);
    ComPtr<IVisaSession> session;
    HRESULT hr = rm->Open(qn::com::Bstr(resource).get(), kNoLock, 2000, nullptr, session.Out());
    EXPECT_EQ(hr, S_OK) << resource;
    ComPtr<IMessage> msg;
    if (session) session.As(msg);
    if (msg) {
        msg->put_TerminationCharacterEnabled(VARIANT_TRUE);
        msg->put_Timeout(timeout_ms);
    }
    return msg;
}

inline HRESULT Write(IMessage* msg, const std::string& text) {
    LONG written = 0;
    return msg->WriteString(qn::com::Bstr(text).get(), &written);
}

inline HRESULT ReadText(IMessage* msg, std::string* out, LONG count = 1024) {
    qn::com::Bstr reply;
    HRESULT hr = msg->ReadString(count, reply.Out());
    *out = reply.utf8();
    return hr;
}

inline std::string ThreadErrorText() {
    qn::com::ErrorRecord rec;
    return qn::com::TakeThreadError(&rec) ? rec.description : std::string();
}

}  // namespace qn::visa::test
