// Waveform transfer and acquisition control against the emulator over a
// loopback socket: scaling, invalid points, the min/max split, record type
// checks, digital bits, Initiate/Status/Abort, and faults during the block.
#include <gtest/gtest.h>

#include <chrono>
#include <cmath>
#include <thread>
#include <vector>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "emulator/emulator.h"
#include "io/io_manager.h"
#include "scope/waveform_transfer.h"

namespace qn::test {
namespace {

std::string WordBlock(const std::vector<std::int16_t>& words) {
    std::string payload;
    for (std::int16_t w : words) {
        payload.push_back(static_cast<char>((static_cast<std::uint16_t>(w) >> 8) & 0xFF));
        payload.push_back(static_cast<char>(w & 0xFF));
    }
    const std::string len = std::to_string(payload.size());
    return "#" + std::to_string(len.size()) + len + payload;
}

std::vector<double> Values(SAFEARRAY* a) {
    com::SafeArray owner(a);
    return std::vector<double>(owner.data<double>(), owner.data<double>() + owner.size());
}

class WaveformOnEmulator : public ::testing::Test {
protected:
    void Start(const char* model, const char* options = "") {
        ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
        emu_ = std::make_unique<emu::Emulator>(model);
        const std::uint16_t port = emu_->Start();
        driver_ = com::MakeComObject<Quorlen731XX>();
        com::Bstr r("TCPIP0::127.0.0.1::" + std::to_string(port) + "::SOCKET"), o(options);
        ASSERT_EQ(driver_->Initialize(r.get(), VARIANT_TRUE, VARIANT_FALSE, o.get()), S_OK)
            << ErrorText();
    }
    CDriverIOManager Io() { return qn::Io(*driver_.get()); }
    ComPtr<IQuorlen731XXMeasurement> Measurement(const char* name) {
        ComPtr<IQuorlen731XXMeasurement> m;
        com::Bstr n(name);
        EXPECT_EQ(static_cast<IQuorlen731XXMeasurements*>(driver_.get())->get_Item(n.get(), m.Out()),
                  S_OK);
        return m;
    }
    HRESULT Fetch(const char* name, std::vector<double>* values, double* x0 = nullptr) {
        SAFEARRAY* a = nullptr;
        double initial = 0, inc = 0;
        HRESULT hr = Measurement(name)->FetchWaveform(&a, &initial, &inc);
        if (a) *values = Values(a);
        if (x0) *x0 = initial;
        return hr;
    }
    // The messages received, after a round trip so that commands sent
    // without a reply have surely arrived; the round trip itself is left out.
    std::vector<std::string> Received() {
        std::string idn;
        EXPECT_EQ(Io().InstrQuery("*IDN?", &idn, 256), S_OK);
        auto all = emu_->ReceivedMessages();
        all.pop_back();
        return all;
    }
    static std::string ErrorText() {
        com::ErrorRecord rec;
        return com::TakeThreadError(&rec) ? rec.description : std::string();
    }
    // The session is as it was before the transfer: status check, termination
    // character and timeout.
    void ExpectRestored(LONG timeout) {
        EXPECT_TRUE(driver_->Core().session.flags.query_instrument_status);
        bool term = false;
        EXPECT_EQ(Io().GetTerminationCharacterEnabled(&term), S_OK);
        EXPECT_TRUE(term);
        LONG t = 0;
        EXPECT_EQ(Io().GetIOTimeout(&t), S_OK);
        EXPECT_EQ(t, timeout);
    }

    std::unique_ptr<emu::Emulator> emu_;
    ComPtr<Quorlen731XX> driver_;
};

TEST_F(WaveformOnEmulator, FetchScalesWordsAndReportsInvalidPoints) {
    Start("QDS4032A");
    ASSERT_EQ(Io().InstrWrite(":CHAN1:RANG 8;:CHAN1:OFFS 0;:DIG"), S_OK);
    emu_->ServeWaveformData(WordBlock({0, 8000, -32768, -8000}));
    std::vector<double> v;
    EXPECT_EQ(Fetch("Channel1", &v), S_IVISCOPE_INVALID_WFM_ELEMENT) << ErrorText();
    EXPECT_NE(ErrorText().find("At least one element in the retrieved waveform was invalid."),
              std::string::npos);
    ASSERT_EQ(v.size(), 4u);
    EXPECT_EQ(v[0], 0.0);
    EXPECT_EQ(v[1], 1.0);
    EXPECT_EQ(v[3], -1.0);
    VARIANT_BOOL invalid = VARIANT_FALSE;
    auto* coll = static_cast<IIviScopeMeasurements*>(driver_.get());
    EXPECT_EQ(coll->IsWaveformElementInvalid(v[2], &invalid), S_OK);
    EXPECT_EQ(invalid, VARIANT_TRUE);
    EXPECT_EQ(coll->IsWaveformElementInvalid(v[1], &invalid), S_OK);
    EXPECT_EQ(invalid, VARIANT_FALSE);
    const auto sent = emu_->ReceivedMessages();
    const std::vector<std::string> tail(sent.end() - 6, sent.end());
    EXPECT_EQ(tail, (std::vector<std::string>{":STAT? CHAN1", ":WAV:SOUR CHAN1",
                                              ":WAV:FORM WORD;UNS 0;BYT MSBF", ":WAV:PRE?",
                                              ":WAV:TYPE?", ":WAV:DATA?"}));
}

TEST_F(WaveformOnEmulator, ReadDigitizesAndBothMeasurementKindsAgree) {
    Start("QDS4032A");
    ComPtr<IIviScopeMeasurement> cc;
    com::Bstr n("Channel1");
    ASSERT_EQ(static_cast<IIviScopeMeasurements*>(driver_.get())->get_Item(n.get(), cc.Out()), S_OK);
    SAFEARRAY* a = nullptr;
    double x0 = 0, dx = 0;
    ASSERT_EQ(cc->ReadWaveform(5000, &a, &x0, &dx), S_OK) << ErrorText();
    const std::vector<double> read = Values(a);
    EXPECT_EQ(read.size(), 1000u);
    EXPECT_GT(dx, 0.0);
    std::vector<double> fetched;
    ASSERT_EQ(Fetch("UserChannel1", &fetched), S_OK);
    EXPECT_EQ(fetched, read);  // same record: no new acquisition in between
    const auto sent = emu_->ReceivedMessages();
    EXPECT_NE(std::find(sent.begin(), sent.end(), ":DIG"), sent.end());
    EXPECT_NE(std::find(sent.begin(), sent.end(), ":WAV:YREF?"), sent.end());
}

TEST_F(WaveformOnEmulator, MinMaxSplitsPairsAndRecordTypesMustMatch) {
    Start("QDS4032A");
    ASSERT_EQ(Io().InstrWrite(":CHAN1:RANG 8;:CHAN1:OFFS 0;:ACQ:TYPE PEAK;:DIG"), S_OK);
    std::vector<std::int16_t> raw(2001);
    for (std::size_t i = 0; i < raw.size(); ++i) raw[i] = static_cast<std::int16_t>(i);
    emu_->ServeWaveformData(WordBlock(raw));
    SAFEARRAY *lo = nullptr, *hi = nullptr;
    double x0 = 0, dx = 0;
    auto m = Measurement("Channel1");
    ASSERT_EQ(m->FetchWaveformMinMax(&lo, &hi, &x0, &dx), S_OK) << ErrorText();
    const auto mins = Values(lo), maxs = Values(hi);
    ASSERT_EQ(mins.size(), 1000u);
    ASSERT_EQ(maxs.size(), 1000u);
    EXPECT_EQ(mins[999], 1998 * 1.25e-4);
    EXPECT_EQ(maxs[999], 1999 * 1.25e-4);

    SAFEARRAY* a = nullptr;
    EXPECT_EQ(m->FetchWaveform(&a, &x0, &dx), E_IVISCOPE_INVALID_ACQ_TYPE);
    EXPECT_EQ(ErrorText(), "Quorlen731XX: Invalid acquisition type.");
    ASSERT_EQ(Io().InstrWrite(":ACQ:TYPE NORM;:DIG"), S_OK);
    EXPECT_EQ(m->FetchWaveformMinMax(&lo, &hi, &x0, &dx), E_IVISCOPE_INVALID_ACQ_TYPE);
    EXPECT_EQ(a, nullptr);
    EXPECT_EQ(lo, nullptr);
}

TEST_F(WaveformOnEmulator, HiddenSourceIsRefusedAndDigitalChannelsReadTheirBit) {
    Start("QMS4034A");
    ASSERT_EQ(Io().InstrWrite(":CHAN2:DISP 0;:POD2:DISP 1;:DIG"), S_OK);
    std::vector<double> v;
    EXPECT_EQ(Fetch("Channel2", &v), E_IVISCOPE_CHANNEL_NOT_ENABLED);
    emu_->ServeWaveformData(std::string("#13\x04\x00\xFB", 6));
    ASSERT_EQ(Fetch("UserDigitalChannel10", &v), S_OK) << ErrorText();
    EXPECT_EQ(v, (std::vector<double>{1, 0, 0}));
    const auto sent = emu_->ReceivedMessages();
    EXPECT_NE(std::find(sent.begin(), sent.end(), ":WAV:SOUR POD2"), sent.end());
    EXPECT_NE(std::find(sent.begin(), sent.end(), ":WAV:FORM BYTE;UNS 1"), sent.end());
}

TEST_F(WaveformOnEmulator, InitiateWithDigitizeCompletesThroughStatus) {
    Start("QDS4032A");
    auto* coll = static_cast<IQuorlen731XXMeasurements*>(driver_.get());
    ASSERT_EQ(Io().InstrWrite("*ESE 36"), S_OK);
    ASSERT_EQ(coll->Initiate(), S_OK) << ErrorText();
    Quorlen731XXAcquisitionStatusEnum s = Quorlen731XXAcqInProgress;
    for (int i = 0; i < 200 && s != Quorlen731XXAcqComplete; ++i) {
        ASSERT_EQ(coll->Status(&s), S_OK);
        if (s != Quorlen731XXAcqComplete) std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    EXPECT_EQ(s, Quorlen731XXAcqComplete);
    EXPECT_FALSE(driver_->Core().acquisition_control.pending);
    LONG ese = 0;
    EXPECT_EQ(Io().InstrQuery("*ESE?", &ese), S_OK);
    EXPECT_EQ(ese, 36);
    EXPECT_EQ(coll->Abort(), S_OK);
    EXPECT_EQ(Received().back(), ":STOP");
}

TEST_F(WaveformOnEmulator, InitiateWithoutDigitizeStartsASingleAcquisition) {
    Start("73141D");
    auto* coll = static_cast<IQuorlen731XXMeasurements*>(driver_.get());
    ASSERT_EQ(coll->Initiate(), S_OK) << ErrorText();
    EXPECT_EQ(Received().back(), ":SING");
    EXPECT_FALSE(driver_->Core().acquisition_control.pending);
    Quorlen731XXAcquisitionStatusEnum s = Quorlen731XXAcqStatusUnknown;
    EXPECT_EQ(coll->Status(&s), S_OK);
    EXPECT_NE(s, Quorlen731XXAcqStatusUnknown);
    EXPECT_EQ(Received().back(), "OPER?");
}

// Faults in the data block: each ends in an error within the timeout, with
// the session's settings restored and the next transfer working.
TEST_F(WaveformOnEmulator, BadBlocksFailCleanlyAndTheSessionRecovers) {
    Start("QDS4032A", "QueryInstrStatus=true");
    ASSERT_EQ(Io().InstrWrite(":DIG"), S_OK);
    ASSERT_EQ(Io().SetIOTimeout(300), S_OK);
    const std::string payload(1000, '\x01');
    struct Case {
        const char* what;
        std::string block;
        HRESULT expected;
    };
    const Case cases[] = {
        {"cut short", "#42000" + payload, E_QUORLEN731XX_IO_TIMEOUT},
        {"header lies about its digit count", "#9" + payload, E_QUORLEN731XX_IO_GENERAL},
        {"header beyond any record", "#9999999999" + payload, E_QUORLEN731XX_IO_GENERAL},
        {"odd byte count for words", "#13abc", E_QUORLEN731XX_IO_GENERAL},
        {"not a block", "1,2,3", E_QUORLEN731XX_IO_GENERAL},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        emu_->ServeWaveformData(c.block);
        std::vector<double> v;
        const auto start = std::chrono::steady_clock::now();
        EXPECT_EQ(Fetch("Channel1", &v), c.expected) << ErrorText();
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5));
        ExpectRestored(300);
        emu_->ClearWaveformData();
        ASSERT_EQ(Fetch("Channel1", &v), S_OK) << ErrorText();
        EXPECT_EQ(v.size(), 1000u);
    }
    // A read waits with its own timeout, different from the session's, and
    // puts the session's back on failure as on success.
    auto m = Measurement("Channel1");
    for (LONG max_time : {200, 4000}) {
        SCOPED_TRACE(max_time);
        if (max_time == 200) emu_->ServeWaveformData("#42000" + payload);
        SAFEARRAY* a = nullptr;
        double x0 = 0, dx = 0;
        EXPECT_EQ(m->ReadWaveform(Quorlen731XXTimeOutEnum(max_time), &a, &x0, &dx),
                  max_time == 200 ? E_QUORLEN731XX_IO_TIMEOUT : S_OK);
        if (a) {
            EXPECT_EQ(Values(a).size(), 1000u);
        }
        ExpectRestored(300);
        emu_->ClearWaveformData();
    }
    // A block longer than it declares: the declared part is the record and
    // the rest of the message is discarded.
    emu_->ServeWaveformData(WordBlock({1, 2}) + "extra bytes");
    std::vector<double> v;
    EXPECT_EQ(Fetch("Channel1", &v), S_OK) << ErrorText();
    EXPECT_EQ(v.size(), 2u);
    emu_->ClearWaveformData();
    ASSERT_EQ(Fetch("Channel1", &v), S_OK) << ErrorText();
    EXPECT_EQ(v.size(), 1000u);
}

TEST_F(WaveformOnEmulator, MissingReplyAndDroppedLinkDuringTheDataRead) {
    Start("QDS4032A", "QueryInstrStatus=true");
    ASSERT_EQ(Io().InstrWrite(":DIG;:WAV:SOUR CHAN1"), S_OK);
    ASSERT_EQ(Io().SetIOTimeout(300), S_OK);
    com::SafeArray data;
    emu_->SuppressReplies(1);
    EXPECT_EQ(ReadWaveformData(*driver_.get(), 2, &data), E_QUORLEN731XX_IO_TIMEOUT);
    ExpectRestored(300);
    ASSERT_EQ(ReadWaveformData(*driver_.get(), 2, &data), S_OK) << ErrorText();
    EXPECT_EQ(data.size(), 1000u);

    emu_->DropConnectionOnNextQuery();
    EXPECT_TRUE(FAILED(ReadWaveformData(*driver_.get(), 2, &data)));
    EXPECT_TRUE(driver_->Core().session.flags.query_instrument_status);
}

}  // namespace
}  // namespace qn::test
