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
#include "io/io_manager.h"
#include "scope/waveform_scaling.h"
#include "scope/waveform_transfer.h"
#include "tests/scope/scope_fixture.h"
#include "tests/support/emulator_driver.h"

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

class WaveformOnEmulator : public ::testing::Test, protected EmulatedDriver {
protected:
    void Start(const char* model, const char* options = "") {
        ASSERT_EQ(Open(model, options), S_OK) << ErrorText();
    }
    CDriverIOManager Io() { return qn::Io(*driver.get()); }
    ComPtr<IQuorlen731XXMeasurement> Measurement(const char* name) {
        return ChannelNamed<IQuorlen731XXMeasurements, IQuorlen731XXMeasurement>(*driver.get(), name);
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
        auto all = emu->ReceivedMessages();
        all.pop_back();
        return all;
    }
    // The session is as it was before the transfer: status check, termination
    // character and timeout.
    void ExpectRestored(LONG timeout) {
        EXPECT_TRUE(driver->Core().session.flags.query_instrument_status);
        bool term = false;
        EXPECT_EQ(Io().GetTerminationCharacterEnabled(&term), S_OK);
        EXPECT_TRUE(term);
        LONG t = 0;
        EXPECT_EQ(Io().GetIOTimeout(&t), S_OK);
        EXPECT_EQ(t, timeout);
    }
};

TEST_F(WaveformOnEmulator, FetchScalesWordsAndReportsInvalidPoints) {
    Start("QDS4032A");
    ASSERT_EQ(Io().InstrWrite(":CHAN1:RANG 8;:CHAN1:OFFS -0.5;:DIG"), S_OK);
    emu->ServeWaveformData(WordBlock({0, 8000, -32768, -8000}));
    std::vector<double> v;
    EXPECT_EQ(Fetch("Channel1", &v), S_IVISCOPE_INVALID_WFM_ELEMENT) << ErrorText();
    EXPECT_NE(ErrorText().find("At least one element in the retrieved waveform was invalid."),
              std::string::npos);
    ASSERT_EQ(v.size(), 4u);
    EXPECT_EQ(v[0], -0.5);  // the origin is the offset
    EXPECT_EQ(v[1], 0.5);
    EXPECT_EQ(v[3], -1.5);
    VARIANT_BOOL invalid = VARIANT_FALSE;
    auto* coll = static_cast<IIviScopeMeasurements*>(driver.get());
    EXPECT_EQ(coll->IsWaveformElementInvalid(v[2], &invalid), S_OK);
    EXPECT_EQ(invalid, VARIANT_TRUE);
    EXPECT_EQ(coll->IsWaveformElementInvalid(v[1], &invalid), S_OK);
    EXPECT_EQ(invalid, VARIANT_FALSE);
    const auto sent = emu->ReceivedMessages();
    const std::vector<std::string> tail(sent.end() - 6, sent.end());
    EXPECT_EQ(tail, (std::vector<std::string>{":STAT? CHAN1", ":WAV:SOUR CHAN1",
                                              ":WAV:FORM WORD;UNS 0;BYT MSBF", ":WAV:PRE?",
                                              ":WAV:TYPE?", ":WAV:DATA?"}));
}

// The read scales with the factor queries, the fetch with the preamble: with
// an offset (the y origin) they must still agree.
TEST_F(WaveformOnEmulator, ReadDigitizesAndBothMeasurementKindsAgree) {
    Start("QDS4032A");
    ASSERT_EQ(Io().InstrWrite(":CHAN1:OFFS -0.37109375"), S_OK);
    auto cc = ChannelNamed<IIviScopeMeasurements, IIviScopeMeasurement>(*driver.get(), "Channel1");
    SAFEARRAY* a = nullptr;
    double x0 = 0, dx = 0;
    ASSERT_EQ(cc->ReadWaveform(5000, &a, &x0, &dx), S_OK) << ErrorText();
    const std::vector<double> read = Values(a);
    EXPECT_EQ(read.size(), 1000u);
    EXPECT_GT(dx, 0.0);
    std::vector<double> fetched;
    ASSERT_EQ(Fetch("UserChannel1", &fetched), S_OK);
    EXPECT_EQ(fetched, read);  // same record: no new acquisition in between
    const auto sent = emu->ReceivedMessages();
    EXPECT_NE(std::find(sent.begin(), sent.end(), ":DIG"), sent.end());
    EXPECT_NE(std::find(sent.begin(), sent.end(), ":WAV:YREF?"), sent.end());
}

TEST_F(WaveformOnEmulator, MinMaxSplitsPairsAndRecordTypesMustMatch) {
    Start("QDS4032A");
    ASSERT_EQ(Io().InstrWrite(":CHAN1:RANG 8;:CHAN1:OFFS 0.25;:ACQ:TYPE PEAK;:DIG"), S_OK);
    std::vector<std::int16_t> raw(2001);
    for (std::size_t i = 0; i < raw.size(); ++i) raw[i] = static_cast<std::int16_t>(i);
    emu->ServeWaveformData(WordBlock(raw));
    SAFEARRAY *lo = nullptr, *hi = nullptr;
    double x0 = 0, dx = 0;
    auto m = Measurement("Channel1");
    ASSERT_EQ(m->FetchWaveformMinMax(&lo, &hi, &x0, &dx), S_OK) << ErrorText();
    const auto mins = Values(lo), maxs = Values(hi);
    ASSERT_EQ(mins.size(), 1000u);
    ASSERT_EQ(maxs.size(), 1000u);
    EXPECT_EQ(mins[999], 1998 * 1.25e-4 + 0.25);
    EXPECT_EQ(maxs[999], 1999 * 1.25e-4 + 0.25);
    // The time axis is the preamble's.
    std::string preamble;
    WaveformScaling s;
    ASSERT_EQ(Io().InstrQuery(":WAV:PRE?", &preamble, 255), S_OK);
    ASSERT_TRUE(ParsePreamble(preamble, &s)) << preamble;
    EXPECT_NE(s.x_origin, 0.0);
    EXPECT_EQ(x0, s.x_origin);
    EXPECT_EQ(dx, s.x_increment);

    SAFEARRAY* a = nullptr;
    EXPECT_EQ(m->FetchWaveform(&a, &x0, &dx), E_IVISCOPE_INVALID_ACQ_TYPE);
    EXPECT_EQ(ErrorText(), "Quorlen731XX: Invalid acquisition type.");
    ASSERT_EQ(Io().InstrWrite(":ACQ:TYPE NORM;:DIG"), S_OK);
    lo = hi = nullptr;  // the arrays went with Values(); a failed call leaves these as they are
    EXPECT_EQ(m->FetchWaveformMinMax(&lo, &hi, &x0, &dx), E_IVISCOPE_INVALID_ACQ_TYPE);
    EXPECT_EQ(a, nullptr);
    EXPECT_EQ(lo, nullptr);
}

TEST_F(WaveformOnEmulator, HiddenSourceIsRefusedAndDigitalChannelsReadTheirBit) {
    Start("QMS4034A");
    ASSERT_EQ(Io().InstrWrite(":CHAN2:DISP 0;:POD2:DISP 1;:DIG"), S_OK);
    std::vector<double> v;
    EXPECT_EQ(Fetch("Channel2", &v), E_IVISCOPE_CHANNEL_NOT_ENABLED);
    emu->ServeWaveformData(std::string("#13\x04\x00\xFB", 6));
    ASSERT_EQ(Fetch("UserDigitalChannel10", &v), S_OK) << ErrorText();
    EXPECT_EQ(v, (std::vector<double>{1, 0, 0}));
    const auto sent = emu->ReceivedMessages();
    EXPECT_NE(std::find(sent.begin(), sent.end(), ":WAV:SOUR POD2"), sent.end());
    EXPECT_NE(std::find(sent.begin(), sent.end(), ":WAV:FORM BYTE;UNS 1"), sent.end());
}

TEST_F(WaveformOnEmulator, InitiateWithDigitizeCompletesThroughStatus) {
    Start("QDS4032A");
    auto* coll = static_cast<IQuorlen731XXMeasurements*>(driver.get());
    ASSERT_EQ(Io().InstrWrite("*ESE 36"), S_OK);
    ASSERT_EQ(coll->Initiate(), S_OK) << ErrorText();
    Quorlen731XXAcquisitionStatusEnum s = Quorlen731XXAcqInProgress;
    for (int i = 0; i < 200 && s != Quorlen731XXAcqComplete; ++i) {
        ASSERT_EQ(coll->Status(&s), S_OK);
        if (s != Quorlen731XXAcqComplete) std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    EXPECT_EQ(s, Quorlen731XXAcqComplete);
    EXPECT_FALSE(driver->Core().acquisition_control.pending);
    LONG ese = 0;
    EXPECT_EQ(Io().InstrQuery("*ESE?", &ese), S_OK);
    EXPECT_EQ(ese, 36);
    EXPECT_EQ(coll->Abort(), S_OK);
    EXPECT_EQ(Received().back(), ":STOP");
}

TEST_F(WaveformOnEmulator, InitiateWithoutDigitizeStartsASingleAcquisition) {
    Start("73141D");
    auto* coll = static_cast<IQuorlen731XXMeasurements*>(driver.get());
    ASSERT_EQ(coll->Initiate(), S_OK) << ErrorText();
    EXPECT_EQ(Received().back(), ":SING");
    EXPECT_FALSE(driver->Core().acquisition_control.pending);
    Quorlen731XXAcquisitionStatusEnum s = Quorlen731XXAcqStatusUnknown;
    EXPECT_EQ(coll->Status(&s), S_OK);
    EXPECT_NE(s, Quorlen731XXAcqStatusUnknown);
    EXPECT_EQ(Received().back(), "OPER?");
}

// The output array a caller passes in: reused when it fits, filled in place
// when it is the caller's own memory, replaced otherwise.
TEST_F(WaveformOnEmulator, OutputArrayIsReusedFilledInPlaceOrReplaced) {
    Start("QDS4032A");
    ASSERT_EQ(Io().InstrWrite(":DIG"), S_OK);
    ComPtr<IQuorlen731XXMeasurement> m = Measurement("Channel1");
    double x0 = 0, dx = 0;
    SAFEARRAY* first = nullptr;
    ASSERT_EQ(m->FetchWaveform(&first, &x0, &dx), S_OK) << ErrorText();
    const std::vector<double> expected = Values(first);
    ASSERT_EQ(expected.size(), 1000u);

    struct Case {
        const char* what;
        VARTYPE vt;
        ULONG count;
        LONG lbound;
        bool locked;
        bool same_array;  // the call keeps the caller's array
    };
    const Case cases[] = {
        {"right type and size", VT_R8, 1000, 0, false, true},
        {"one element short", VT_R8, 999, 0, false, false},
        {"one element over", VT_R8, 1001, 0, false, false},
        {"lower bound 1", VT_R8, 1000, 1, false, false},
        {"floats", VT_R4, 1000, 0, false, false},
        {"locked", VT_R8, 1000, 0, true, false},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        com::SafeArray given = com::SafeArray::Vector(c.vt, c.count, c.lbound);
        if (c.locked) {
            void* p = nullptr;
            ASSERT_EQ(SafeArrayAccessData(given.get(), &p), S_OK);
        }
        SAFEARRAY* a = given.get();
        ASSERT_EQ(m->FetchWaveform(&a, &x0, &dx), S_OK) << ErrorText();
        EXPECT_EQ(a == given.get(), c.same_array);
        if (a != given.get()) {
            if (!c.locked) (void)given.Detach();  // destroyed by the call
            EXPECT_EQ(a->vt, VT_R8);
            EXPECT_EQ(a->rgsabound[0].lLbound, 0);
            EXPECT_EQ(Values(a), expected);
        } else {
            EXPECT_EQ(std::vector<double>(given.data<double>(), given.data<double>() + 1000),
                      expected);
        }
        if (c.locked) {
            EXPECT_EQ(SafeArrayUnaccessData(given.get()), S_OK);
        }
    }

    // The caller's own memory (as the C API passes it): it receives the
    // points that fit, its bound telling how many; nothing beyond is written.
    for (const ULONG room : {1000u, 1500u, 999u, 0u}) {
        SCOPED_TRACE(room);
        std::vector<double> memory(room + 1, -7.0);
        com::SafeArray over = com::SafeArray::Over(VT_R8, memory.data(), room);
        SAFEARRAY* a = over.get();
        ASSERT_EQ(m->FetchWaveform(&a, &x0, &dx), S_OK) << ErrorText();
        EXPECT_EQ(a, over.get());
        const std::size_t n = std::min<std::size_t>(room, 1000);
        EXPECT_EQ(over.size(), n);
        EXPECT_EQ(std::vector<double>(memory.begin(), memory.begin() + long(n)),
                  std::vector<double>(expected.begin(), expected.begin() + long(n)));
        EXPECT_EQ(memory[n], -7.0);
    }
    // One of another element type is refused, and the session goes on.
    std::vector<float> floats(1000);
    com::SafeArray wrong = com::SafeArray::Over(VT_R4, floats.data(), 1000);
    SAFEARRAY* w = wrong.get();
    EXPECT_EQ(m->FetchWaveform(&w, &x0, &dx), E_IVI_INVALID_VALUE);
    EXPECT_NE(ErrorText().find("WaveformArray"), std::string::npos);
    EXPECT_EQ(w, wrong.get());
    std::vector<double> v;
    EXPECT_EQ(Fetch("Channel1", &v), S_OK) << ErrorText();
    EXPECT_EQ(v.size(), 1000u);

    // The block's memory stays with the session until Close.
    const ReceiveBuffer& buffer = driver->Core().io->Receive();
    const BYTE* kept = buffer.data();
    EXPECT_GE(buffer.capacity(), 2000u);
    EXPECT_EQ(Fetch("Channel1", &v), S_OK) << ErrorText();
    EXPECT_EQ(buffer.data(), kept);
    EXPECT_EQ(driver->Close(), S_OK);
    EXPECT_EQ(buffer.capacity(), 0u);
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
        emu->ServeWaveformData(c.block);
        std::vector<double> v;
        const auto start = std::chrono::steady_clock::now();
        EXPECT_EQ(Fetch("Channel1", &v), c.expected) << ErrorText();
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5));
        ExpectRestored(300);
        emu->ClearWaveformData();
        ASSERT_EQ(Fetch("Channel1", &v), S_OK) << ErrorText();
        EXPECT_EQ(v.size(), 1000u);
    }
    // A read waits with its own timeout, different from the session's, and
    // puts the session's back on failure as on success.
    auto m = Measurement("Channel1");
    for (LONG max_time : {200, 4000}) {
        SCOPED_TRACE(max_time);
        if (max_time == 200) emu->ServeWaveformData("#42000" + payload);
        SAFEARRAY* a = nullptr;
        double x0 = 0, dx = 0;
        EXPECT_EQ(m->ReadWaveform(Quorlen731XXTimeOutEnum(max_time), &a, &x0, &dx),
                  max_time == 200 ? E_QUORLEN731XX_IO_TIMEOUT : S_OK);
        if (a) {
            EXPECT_EQ(Values(a).size(), 1000u);
        }
        ExpectRestored(300);
        emu->ClearWaveformData();
    }
    // A block longer than it declares: the declared part is the record and
    // the rest of the message is discarded.
    emu->ServeWaveformData(WordBlock({1, 2}) + "extra bytes");
    std::vector<double> v;
    EXPECT_EQ(Fetch("Channel1", &v), S_OK) << ErrorText();
    EXPECT_EQ(v.size(), 2u);
    emu->ClearWaveformData();
    ASSERT_EQ(Fetch("Channel1", &v), S_OK) << ErrorText();
    EXPECT_EQ(v.size(), 1000u);
}

TEST_F(WaveformOnEmulator, MissingReplyAndDroppedLinkDuringTheDataRead) {
    Start("QDS4032A", "QueryInstrStatus=true");
    ASSERT_EQ(Io().InstrWrite(":DIG;:WAV:SOUR CHAN1"), S_OK);
    ASSERT_EQ(Io().SetIOTimeout(300), S_OK);
    RawWaveform data;
    emu->SuppressReplies(1);
    EXPECT_EQ(ReadWaveformData(*driver.get(), 2, &data), E_QUORLEN731XX_IO_TIMEOUT);
    ExpectRestored(300);
    ASSERT_EQ(ReadWaveformData(*driver.get(), 2, &data), S_OK) << ErrorText();
    EXPECT_EQ(data.count, 1000u);

    emu->DropConnectionOnNextQuery();
    EXPECT_TRUE(FAILED(ReadWaveformData(*driver.get(), 2, &data)));
    EXPECT_TRUE(driver->Core().session.flags.query_instrument_status);
}

}  // namespace
}  // namespace qn::test
