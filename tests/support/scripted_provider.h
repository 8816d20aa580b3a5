// A strict scripted I/O provider for component tests: each write must be the
// next expected message, byte for byte; each read gets the reply scripted
// for it. Anything unexpected fails the running test.
#pragma once

#include <gtest/gtest.h>

#include <cstring>
#include <deque>
#include <optional>
#include <string>
#include <vector>

#include "io/provider.h"
#include "platform/com/errorinfo.h"

namespace qn::test {

class ScriptedProvider : public CDriverIOProvider {
public:
    struct Step {
        std::string expect;  // the exact bytes written
        std::string reply;   // bytes then available to read ("" = none)
        bool timeout = false;  // the read after this write times out
    };

    // Expects `write`; when `reply` is given, the next read returns it.
    ScriptedProvider& Expect(std::string write, std::string reply = {}) {
        steps_.push_back({std::move(write), std::move(reply), false});
        return *this;
    }
    // Expects `write`; the read that follows times out.
    ScriptedProvider& ExpectTimeout(std::string write) {
        steps_.push_back({std::move(write), {}, true});
        return *this;
    }
    // Every "*ESR?" is answered with `value` without being scripted.
    void AnswerStatusWith(std::string value) { esr_ = std::move(value); }

    bool Done() const { return steps_.empty(); }
    const std::vector<std::string>& Written() const { return written_; }
    int Clears() const { return clears_; }
    LONG SessionTimeout() const { return timeout_; }

    HRESULT Open(const CErrorManagerBase&, const SessionFlags* flags, const std::string&) override {
        SetOwnerFlags(flags);
        initialized_ = true;
        return S_OK;
    }
    void Close() override {
        initialized_ = false;
        SetOwnerFlags(nullptr);
    }
    IMessage* MessageInterface() const override { return nullptr; }
    IFormattedIO488* FormattedInterface() const override { return nullptr; }
    IFormattedIO488Direct* FormattedDirect() const override { return nullptr; }
    IRegister* RegisterInterface() const override { return nullptr; }

protected:
    HRESULT RawWrite(const BYTE* data, LONG count, LONG* written) override {
        std::string msg(reinterpret_cast<const char*>(data), std::size_t(count));
        written_.push_back(msg);
        *written = count;
        if (msg == "*ESR?\n" && esr_) {
            pending_ = *esr_ + "\n";
            return S_OK;
        }
        if (steps_.empty()) {
            ADD_FAILURE() << "unexpected message: " << Printable(msg);
            return E_FAIL;
        }
        Step s = steps_.front();
        steps_.pop_front();
        EXPECT_EQ(Printable(msg), Printable(s.expect));
        timeout_next_ = s.timeout;
        pending_ = s.reply;
        return S_OK;
    }
    HRESULT RawRead(BYTE* buf, LONG count, LONG* actual) override {
        if (timeout_next_) {
            timeout_next_ = false;
            com::SetThreadError(GUID_NULL, "VISA", "Timeout expired before operation completed.");
            return kProviderTimeout;
        }
        std::size_t n = std::min<std::size_t>(pending_.size(), std::size_t(count));
        std::memcpy(buf, pending_.data(), n);
        pending_.erase(0, n);
        *actual = LONG(n);
        return S_OK;
    }
    HRESULT RawReadArray(LONG, SAFEARRAY**) override { return E_NOTIMPL; }
    HRESULT RawClear() override {
        ++clears_;
        pending_.clear();
        return S_OK;
    }
    HRESULT RawReadSTB(SHORT* stb) override {
        *stb = 0;
        return S_OK;
    }
    HRESULT RawGetTimeout(LONG* ms) override {
        *ms = timeout_;
        return S_OK;
    }
    HRESULT RawSetTimeout(LONG ms) override {
        timeout_ = ms;
        return S_OK;
    }
    HRESULT RawInterface(SHORT* type, std::string* rc) override {
        *type = 6;
        *rc = "SOCKET";
        return S_OK;
    }
    HRESULT RawGetBool(int, bool* v) override {
        *v = true;
        return S_OK;
    }
    HRESULT RawSetBool(int, bool) override { return S_OK; }
    HRESULT RawGetTermChar(BYTE* c) override {
        *c = '\n';
        return S_OK;
    }
    HRESULT RawSetTermChar(BYTE) override { return S_OK; }

private:
    static std::string Printable(const std::string& s) {
        std::string out;
        for (char c : s) out += c == '\n' ? std::string("\\n") : std::string(1, c);
        return out;
    }

    std::deque<Step> steps_;
    std::vector<std::string> written_;
    std::string pending_;
    std::optional<std::string> esr_;
    bool timeout_next_ = false;
    int clears_ = 0;
    LONG timeout_ = 2000;
};

}  // namespace qn::test
