// Exact SCPI traffic of the status registers, the service-request masks, the
// acquisition-pending protocol and the restores of the waveform data read,
// against the strict scripted provider.
#include <gtest/gtest.h>

#include <algorithm>
#include <deque>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "scope/waveform_transfer.h"
#include "tests/scope/scope_fixture.h"

namespace qn::test {
namespace {

// The scripted provider with a scripted status byte, a remembered
// termination-character setting and injectable failures.
class StatusProvider : public ScriptedProvider {
public:
    std::deque<SHORT> stb;
    bool term_char = true;
    bool fail_term_get = false, fail_term_set = false, fail_next_write = false;
    int stb_reads = 0;

protected:
    HRESULT RawReadSTB(SHORT* v) override {
        ++stb_reads;
        *v = stb.empty() ? 0 : stb.front();
        if (!stb.empty()) stb.pop_front();
        return S_OK;
    }
    HRESULT RawGetBool(int which, bool* v) override {
        if (which != 1) return ScriptedProvider::RawGetBool(which, v);
        if (fail_term_get) return E_FAIL;
        *v = term_char;
        return S_OK;
    }
    HRESULT RawSetBool(int which, bool v) override {
        if (which != 1) return S_OK;
        if (fail_term_set && !v) return E_FAIL;
        term_char = v;
        return S_OK;
    }
    HRESULT RawWrite(const BYTE* data, LONG count, LONG* written) override {
        if (std::exchange(fail_next_write, false)) return E_FAIL;
        return ScriptedProvider::RawWrite(data, count, written);
    }
};

class StatusTraffic : public ScriptedSessionTest<StatusProvider> {
protected:
    IQuorlen731XXStatus* Status() { return driver_.get(); }
    IQuorlen731XXMeasurements* Measurements() { return driver_.get(); }
    // Initiate of an Average acquisition: the abort sequence, the type, the
    // saved enable, operation complete only, the old events read (by the
    // status check when it is on, else by `esr`), then digitize.
    void ExpectAverageInitiate(const char* count, const char* ese, const char* esr) {
        Expect({":STOP", "ACQ:TYPE?|AVER", count, ese, "*ESE 1"});
        if (esr) Expect({esr});
        Expect({":DIG;*OPC"});
    }
};

// 73141D has channel protection, 73121D has not; neither has the digitize
// feature.
constexpr const char* kProtected = "73141D";
constexpr const char* kUnprotected = "73121D";

std::string Masks(LONG sre, LONG ese, LONG opee, LONG ovl) {
    return "*CLS; *SRE " + std::to_string(sre) + "; *ESE " + std::to_string(ese) + "; :OPEE " +
           std::to_string(opee) + "; :OVL " + std::to_string(ovl) + "\n";
}

// Every reason alone against the documented mask bits, then all reasons at
// once (the largest accepted value) and the first values refused.
TEST_F(StatusTraffic, EachServiceRequestReasonSetsItsDocumentedMaskBits) {
    Open(kProtected);
    struct Reason {
        LONG value, sre, ese, opee, ovl;
    };
    const Reason reasons[] = {
        {1, 16, 0, 0, 0},           {2, 4, 0, 0, 0},           {4, 32, 1, 0, 0},
        {8, 32, 4, 0, 0},           {16, 32, 8, 0, 0},         {32, 32, 16, 0, 0},
        {64, 32, 32, 0, 0},         {128, 32, 64, 0, 0},       {256, 32, 128, 0, 0},
        {1024, 2, 0, 0, 0},         {2048, 1, 0, 0, 0},        {8192, 128, 0, 8, 0},
        {16384, 128, 0, 32, 0},     {32768, 128, 0, 2048, 1},  {65536, 128, 0, 2048, 2},
        {131072, 128, 0, 2048, 4},  {262144, 128, 0, 2048, 8}, {524288, 128, 0, 2048, 16},
        {1048576, 0, 0, 0, 0},      {2097152, 0, 0, 0, 0},     {4194304, 0, 0, 0, 0},
        {8388608, 0, 0, 0, 0},      {16777216, 0, 0, 0, 0},    {0, 0, 0, 0, 0},
    };
    for (const Reason& r : reasons) {
        io_->Expect(Masks(r.sre, r.ese, r.opee, r.ovl));
        EXPECT_EQ(Status()->ConfigureServiceRequest(Quorlen731XXSRQReasonEnum(r.value)), S_OK)
            << r.value;
    }
    io_->Expect(Masks(183, 253, 2088, 31));
    EXPECT_EQ(Status()->ConfigureServiceRequest(Quorlen731XXSRQReasonEnum(0x1FFFFFF)), S_OK);
    for (LONG bad : {LONG(0x2000000), LONG(-1), LONG(INT32_MIN)}) {
        EXPECT_EQ(Status()->ConfigureServiceRequest(Quorlen731XXSRQReasonEnum(bad)),
                  E_IVI_INVALID_VALUE);
        EXPECT_NE(ErrorText().find("(" + std::to_string(bad) +
                                   ") for method ConfigureServiceRequest, parameter Reason"),
                  std::string::npos);
    }
}

TEST_F(StatusTraffic, WithoutChannelProtectionOverloadIsRefusedAndThreeMasksSent) {
    Open(kUnprotected);
    EXPECT_EQ(Status()->ConfigureServiceRequest(Quorlen731XXSRQReasonOverloadChan3),
              E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    EXPECT_NE(ErrorText().find("Quorlen731XXSRQReasonOverloadChan3"), std::string::npos);
    io_->Expect("*CLS; *SRE 16; *ESE 0; :OPEE 0\n");
    EXPECT_EQ(Status()->ConfigureServiceRequest(Quorlen731XXSRQReasonStbMAV), S_OK);
    io_->Expect("*CLS;:OPEE 31\n").Expect("*CLS\n");
    EXPECT_EQ(Status()->Preset(), S_OK);
    EXPECT_EQ(Status()->Clear(), S_OK);
    EXPECT_EQ(Status()->put_Register(Quorlen731XXStatusRegisterOverloadEvent,
                                     Quorlen731XXStatusSubRegisterEnable, 1),
              E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
    EXPECT_NE(ErrorText().find("Quorlen731XXStatusRegisterOverloadEvent"), std::string::npos);
}

// Every register and sub-register in both dialects, each read answered with
// its own value. nullptr: rejected; "": the constant 1 without I/O.
TEST_F(StatusTraffic, EveryRegisterReadsWithItsDocumentedQuery) {
    struct Read {
        LONG reg;
        const char* query[3];  // condition, event, enable
    };
    const Read newer[] = {
        {Quorlen731XXStatusRegisterStatusByte, {nullptr, "*STB?", "*SRE?"}},
        {Quorlen731XXStatusRegisterStandardEvent, {nullptr, "*ESR?", "*ESE?"}},
        {Quorlen731XXStatusRegisterOperation, {"OPER:COND?", ":OPER:EVEN?", ":OPEE?"}},
        {Quorlen731XXStatusRegisterOverloadEvent, {nullptr, ":OVLR?", "OVL?"}},
        {Quorlen731XXStatusRegisterTriggerEvent, {nullptr, ":TER?", ""}},
        {Quorlen731XXStatusRegisterArmEvent, {nullptr, ":AER?", ""}},
    };
    Open(kProtected);
    for (bool early : {false, true}) {
        driver_->Core().features.early_family = early;
        for (const Read& r : newer) {
            for (LONG sub = 0; sub < 3; ++sub) {
                const char* query = r.query[sub];
                if (early && r.reg == Quorlen731XXStatusRegisterOperation)
                    query = sub == 0 ? "OPER?" : sub == 1 ? nullptr : query;
                SCOPED_TRACE(std::to_string(r.reg) + "/" + std::to_string(sub) +
                             (early ? " early" : ""));
                const LONG reply = 100 + 10 * r.reg + sub;
                if (query && *query) io_->Expect(std::string(query) + "\n", std::to_string(reply) + "\n");
                LONG v = -7;
                const HRESULT hr = Status()->get_Register(Quorlen731XXStatusRegisterEnum(r.reg),
                                                          Quorlen731XXStatusSubRegisterEnum(sub), &v);
                EXPECT_EQ(hr, query ? S_OK : E_IVI_INVALID_VALUE);
                if (query) {
                    EXPECT_EQ(v, *query ? reply : 1);
                }
                EXPECT_TRUE(io_->Done());
            }
        }
    }
    // A failed read gives -1.
    io_->ExpectTimeout("*ESR?\n");
    LONG v = 5;
    EXPECT_EQ(Status()->get_Register(Quorlen731XXStatusRegisterStandardEvent,
                                     Quorlen731XXStatusSubRegisterEvent, &v),
              E_QUORLEN731XX_IO_TIMEOUT);
    EXPECT_EQ(v, -1);
    // The message carries the transport's reason.
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: IO timeout error: Timeout expired before operation completed..");
}

TEST_F(StatusTraffic, RejectedRegisterAccessNamesWhatWasRejected) {
    Open(kProtected);
    struct Case {
        bool put;
        LONG reg, sub;
        const char* text;
    };
    const Case cases[] = {
        {false, Quorlen731XXStatusRegisterOperation, Quorlen731XXStatusSubRegisterEvent,
         "Invalid value (Quorlen731XXStatusSubRegisterEvent) for method get_Register, parameter "
         "SubRegister."},
        {false, Quorlen731XXStatusRegisterStatusByte, Quorlen731XXStatusSubRegisterCondition,
         "(Quorlen731XXStatusSubRegisterCondition) for method get_Register"},
        {true, Quorlen731XXStatusRegisterStandardEvent, Quorlen731XXStatusSubRegisterCondition,
         "(Quorlen731XXStatusSubRegisterCondition) for method put_Register"},
        {true, Quorlen731XXStatusRegisterTriggerEvent, Quorlen731XXStatusSubRegisterEnable,
         "Invalid value (4) for method put_Register, parameter Register."},
        {true, Quorlen731XXStatusRegisterArmEvent, Quorlen731XXStatusSubRegisterEnable,
         "Invalid value (5) for method put_Register"},
        {false, Quorlen731XXStatusRegisterOperation, 3,
         "Invalid value (Unknown Quorlen731XXStatusSubRegisterEnum) for method "
         "ReturnInvalidSubRegister, parameter eSubRegister."},
        {true, 6, Quorlen731XXStatusSubRegisterEnable, "Invalid value (6) for method put_Register"},
    };
    for (const Case& c : cases) {
        LONG v = 0;
        const auto reg = Quorlen731XXStatusRegisterEnum(c.reg);
        const auto sub = Quorlen731XXStatusSubRegisterEnum(c.sub);
        HRESULT hr = c.put ? Status()->put_Register(reg, sub, 1) : Status()->get_Register(reg, sub, &v);
        EXPECT_EQ(hr, E_IVI_INVALID_VALUE) << c.text;
        EXPECT_NE(ErrorText().find(c.text), std::string::npos) << c.text;
    }
}

TEST_F(StatusTraffic, RegisterWritesMaskTheValueAndPresetClearsOverload) {
    Open(kProtected);
    // Each value has every bit of the mask and the bit above it set; the
    // second has every bit set but the mask's lowest.
    const std::tuple<LONG, LONG, const char*> writes[] = {
        {Quorlen731XXStatusRegisterStatusByte, 0x1FF, "*SRE 255\n"},
        {Quorlen731XXStatusRegisterStandardEvent, 0x1FF, "*ESE 255\n"},
        {Quorlen731XXStatusRegisterOperation, 0x1FFFF, ":OPEE 65535\n"},
        {Quorlen731XXStatusRegisterOverloadEvent, 0x1FFF, ":OVL 4095\n"},
        {Quorlen731XXStatusRegisterStandardEvent, -2, "*ESE 254\n"},
        {Quorlen731XXStatusRegisterOverloadEvent, -2, ":OVL 4094\n"},
    };
    for (auto [reg, value, sent] : writes) {
        io_->Expect(sent);
        EXPECT_EQ(Status()->put_Register(Quorlen731XXStatusRegisterEnum(reg),
                                         Quorlen731XXStatusSubRegisterEnable, value),
                  S_OK)
            << sent;
    }
    io_->Expect("*CLS;:OPEE 31;:OVL 0\n");
    EXPECT_EQ(Status()->Preset(), S_OK);
    io_->stb = {0x44};
    LONG stb = 0;
    EXPECT_EQ(Status()->get_SerialPoll(&stb), S_OK);
    EXPECT_EQ(stb, 0x44);
}

TEST_F(StatusTraffic, AverageAcquisitionCompletesThroughTheOperationCompleteEvent) {
    Open(kProtected);
    // Initiate: the abort sequence, the type (Average), the saved enable,
    // operation complete only, the old events read, then digitize.
    ExpectAverageInitiate(":ACQ:COUN?|8", "*ESE?|36", "*ESR?|0");
    EXPECT_EQ(Measurements()->Initiate(), S_OK);
    EXPECT_TRUE(driver_->Core().acquisition_control.pending);

    // Status reads only the status byte while pending; its event summary bit
    // alone ends it (every other bit set does not) and puts the saved enable
    // back.
    io_->stb = {0xDF, 0x20};
    Quorlen731XXAcquisitionStatusEnum s = Quorlen731XXAcqStatusUnknown;
    EXPECT_EQ(Measurements()->Status(&s), S_OK);
    EXPECT_EQ(s, Quorlen731XXAcqInProgress);
    io_->Expect("*ESE 36\n");
    EXPECT_EQ(Measurements()->Status(&s), S_OK);
    EXPECT_EQ(s, Quorlen731XXAcqComplete);
    EXPECT_FALSE(driver_->Core().acquisition_control.pending);

    // Not pending: the run bit of the operation condition alone decides.
    io_->Expect("OPER?\n", "8\n").Expect("OPER?\n", "32759\n");
    EXPECT_EQ(Measurements()->Status(&s), S_OK);
    EXPECT_EQ(s, Quorlen731XXAcqInProgress);
    IviScopeAcquisitionStatusEnum cs = IviScopeAcqStatusUnknown;
    EXPECT_EQ(static_cast<IIviScopeMeasurements*>(driver_.get())->Status(&cs), S_OK);
    EXPECT_EQ(cs, IviScopeAcqComplete);
}

TEST_F(StatusTraffic, DigitizeIsSentWithoutAStatusCheck) {
    Open(kProtected, "QueryInstrStatus=true");
    ExpectAverageInitiate(":ACQ:COUN?|8", "*ESE?|36", nullptr);
    EXPECT_EQ(Measurements()->Initiate(), S_OK);
    // The commands before it are checked; a status query after it would
    // read and clear the operation-complete event that ends the acquisition.
    const std::vector<std::string>& sent = io_->Written();
    const auto ese = std::find(sent.begin(), sent.end(), "*ESE 1\n");
    ASSERT_NE(ese, sent.end());
    EXPECT_EQ(*std::next(ese), "*ESR?\n");
    EXPECT_EQ(sent.back(), ":DIG;*OPC\n");
}

TEST_F(StatusTraffic, AbortEndsAPendingAcquisition) {
    Open(kProtected);
    ExpectAverageInitiate(":ACQ:COUN?|4", "*ESE?|0", "*ESR?|1");
    ASSERT_EQ(Measurements()->Initiate(), S_OK);
    const int clears = io_->Clears();
    io_->Expect("*ESE 0\n").Expect(":STOP\n");
    EXPECT_EQ(Measurements()->Abort(), S_OK);
    EXPECT_EQ(io_->stb_reads, 2);
    EXPECT_EQ(io_->Clears(), clears + 1);
    EXPECT_FALSE(driver_->Core().acquisition_control.pending);
}

TEST_F(StatusTraffic, NormalAcquisitionWithoutDigitizeSendsSingle) {
    Open(kProtected);
    io_->Expect(":STOP\n").Expect("ACQ:TYPE?\n", "NORM\n").Expect(":SING\n");
    EXPECT_EQ(Measurements()->Initiate(), S_OK);
    EXPECT_FALSE(driver_->Core().acquisition_control.pending);
    EXPECT_EQ(io_->stb_reads, 0);
    io_->Expect(":AUT\n");
    EXPECT_EQ(static_cast<IIviScopeMeasurements*>(driver_.get())->AutoSetup(), S_OK);
}

// Every way the data read can fail leaves the status check and the
// termination character as they were.
TEST_F(StatusTraffic, WaveformDataReadRestoresPollingAndTermCharOnEveryPath) {
    enum Fault { kWrite, kTermGet, kTermSet, kBlock };
    for (Fault f : {kWrite, kTermGet, kTermSet, kBlock}) {
        SCOPED_TRACE(f);
        Open(kProtected, "QueryInstrStatus=true");
        const std::size_t before = io_->Written().size();
        if (f == kWrite) io_->fail_next_write = true;
        else io_->Expect(":WAV:DATA?\n");
        io_->fail_term_get = f == kTermGet;
        io_->fail_term_set = f == kTermSet;
        RawWaveform data;
        EXPECT_TRUE(FAILED(ReadWaveformData(*driver_.get(), 2, &data)));
        EXPECT_TRUE(driver_->Core().session.flags.query_instrument_status);
        EXPECT_TRUE(io_->term_char);
        // No status query was sent in the middle of the block's message.
        for (std::size_t i = before; i < io_->Written().size(); ++i)
            EXPECT_NE(io_->Written()[i], "*ESR?\n");
        EXPECT_TRUE(io_->Done());
        driver_->Close();
    }
}

}  // namespace
}  // namespace qn::test
