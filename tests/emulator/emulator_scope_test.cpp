// Scope subsystems over the socket: per-channel state, refusals by range and by feature,
// setup memory, acquisitions with the operation register, and waveform blocks.
#include <gtest/gtest.h>

#include <cstdint>

#include "tests/emulator/scpi_client.h"

namespace qn::emu {
namespace {

using namespace test;

std::string Field(const std::string& csv, int index) {
    std::size_t begin = 0;
    for (int i = 0; i < index; ++i) begin = csv.find(',', begin) + 1;
    return csv.substr(begin, csv.find(',', begin) - begin);
}

TEST(EmulatorScope, RelativeHeadersKeepTheChannelSuffixOfTheirPath) {
    Session s("QDS4034A");
    auto& c = s.client;
    c.Send(":CHANnel2:RANGe 2;OFFSet 0.5;:chan3:range 4");
    EXPECT_EQ(c.Query(":CHAN2:RANG?;OFFS?;:CHAN1:OFFS?;:CHANNEL3:RANGE?"), "2;0.5;0;4");
    c.Send(":TIM:RANG 2E-3;POS 1e-4;REF LEFT");
    EXPECT_EQ(c.Query(":timebase:range?;position?;reference?"), "0.002;0.0001;LEFT");
    EXPECT_EQ(c.Query(":WAV:FORM BYTE;UNS 1;BYT LSBF;:WAV:FORM?;UNS?;BYT?"), "BYTE;1;LSBF");
    EXPECT_EQ(c.Query("SYST:ERR?"), kNoError);
}

TEST_P(Refusals, ValuesAndFeaturesTheModelLacks) {
    const Refusal& r = GetParam();
    Session s(r.model);
    s.client.Send(r.message);
    EXPECT_EQ(s.client.Query("SYST:ERR?"), r.error ? r.error : kNoError);
}

INSTANTIATE_TEST_SUITE_P(
    Scope, Refusals,
    ::testing::Values(
        Refusal{"QDS4034A", ":CHAN1:RANG 100", kOutOfRange},
        Refusal{"QDS4034A", ":CHAN1:PROB 10;:CHAN1:RANG 100", nullptr},
        Refusal{"QDS4034A", ":CHAN5:RANG 1", R"(-114,"Header suffix out of range")"},
        Refusal{"QDS4032A", ":CHAN3:DISP 1", R"(-114,"Header suffix out of range")"},
        Refusal{"QDS4034A", ":CHAN1:COUP GND", R"(-241,"Hardware missing")"},
        Refusal{"QDS2014A", ":CHAN1:COUP GND", nullptr},
        Refusal{"QDS4034A", ":CHAN1:COUP XYZ", kIllegal},
        Refusal{"73122A", ":CHAN1:IMP FIFT", R"(-241,"Hardware missing")"},
        Refusal{"73141A", ":CHAN1:IMP FIFTY", nullptr},
        Refusal{"73122A", ":CHAN1:PROB:SKEW 1e-9", R"(-113,"Undefined header")"},
        Refusal{"QDS4034A", ":CHAN1:PROB:SKEW 1e-6", kOutOfRange},
        Refusal{"QDS3014L", ":CHAN1:PROT?", R"(-113,"Undefined header")"},
        Refusal{"QDS3014L", ":OVL 0", R"(-113,"Undefined header")"},
        Refusal{"QDS4034A", "*CLS;:OPEE 31;:OVL 0", nullptr},
        Refusal{"QDS2014A", ":WAV:POIN MAX, 2000", R"(-108,"Parameter not allowed")"},
        Refusal{"QDS4032A", ":WAV:POIN MAX, 2000", nullptr},
        Refusal{"QDS4034A", ":WAV:POIN 0", kOutOfRange},
        Refusal{"QDS4034A", ":POD1:DISP 1", R"(-113,"Undefined header")"},
        Refusal{"QMS4034A", ":POD2:DISP 1;:WAV:SOUR POD2", nullptr},
        Refusal{"QMS4034A", ":WAV:SOUR POD3", kIllegal},
        Refusal{"QDS4034A", ":TIM:REF MIDDLE", kIllegal},
        Refusal{"QDS4034A", ":ACQ:COUN 0", kOutOfRange},
        Refusal{"QDS4034A", ":CHAN1:LAB \"this label is far too long to display\"", kOutOfRange},
        Refusal{"QDS4034A", ":CHAN1:RANG 1V", R"(-104,"Data type error")"}));

TEST(EmulatorScope, ResetAndSetupMemory) {
    Session s("QDS4034A");
    auto& c = s.client;
    c.Send(":CHAN1:RANG 2;:CHAN1:LAB \"V\"\"in\";:ACQ:TYPE AVER;COUN 16");
    c.Send("*SAV 3;*RST");
    EXPECT_EQ(c.Query(":CHAN1:RANG?;LAB?;:ACQ:TYPE?;COUN?"), R"(8;"1";NORM;8)");
    c.Send("*RCL 3");
    EXPECT_EQ(c.Query(":CHAN1:RANG?;LAB?;:ACQ:TYPE?;COUN?"), R"(2;"V""in";AVER;16)");
}

TEST(EmulatorScope, SingleAcquisitionRunsThenCompletesOperation) {
    Session s("QDS4034A");
    auto& c = s.client;
    EXPECT_EQ(c.Query(":OPER:EVEN?;:STAT? CHAN1;:STAT? CHAN2"), "0;1;0");
    EXPECT_EQ(c.Query(":SING;*OPC;:OPER:COND?"), "8");  // run bit while acquiring
    EXPECT_EQ(c.Query("*OPC?"), "1");
    EXPECT_EQ(c.Query("OPER:COND?;:OPER:EVEN?;:OPER:EVEN?"), "0;8;0");
    EXPECT_EQ(c.Query("*ESR?"), "1");  // operation complete once the record was taken
    c.Send("*ESE 1;:DIG;*OPC");
    EXPECT_EQ(c.Query("*STB?"), "32");  // the driver's completion poll
}

TEST(EmulatorScope, WaveformBlocksFollowFormatByteOrderAndType) {
    Session s("QDS4034A");
    auto& c = s.client;
    c.Send(":CHAN1:RANG 8;OFFS 0;:WAV:SOUR CHAN1;:WAV:POIN 1000");
    c.Send(":WAV:DATA?");
    EXPECT_EQ(c.Query("SYST:ERR?"), kConflict);  // nothing acquired yet
    c.Send(":DIG");
    c.Send(":WAV:FORM WORD;UNS 0;BYT MSBF");
    const std::string msb = ReadBlock(c, ":WAV:DATA?");
    ASSERT_EQ(msb.size(), 2000u);
    c.Send(":WAV:BYT LSBF");
    const std::string lsb = ReadBlock(c, ":WAV:DATA?");
    ASSERT_EQ(lsb.size(), 2000u);
    const auto pre = c.Query(":WAV:PRE?");
    const double yinc = std::stod(Field(pre, 7));
    double peak = 0;
    for (std::size_t i = 0; i < msb.size(); i += 2) {
        EXPECT_EQ(msb[i], lsb[i + 1]);
        EXPECT_EQ(msb[i + 1], lsb[i]);
        const auto code = static_cast<std::int16_t>(static_cast<std::uint8_t>(msb[i]) << 8 |
                                                    static_cast<std::uint8_t>(msb[i + 1]));
        EXPECT_NE(code, -32768);  // never the invalid-point marker
        peak = std::max(peak, std::abs(code * yinc));
    }
    EXPECT_GT(peak, 0.3 * 8 * 0.9);  // a 2.4 V sine plus a little noise
    EXPECT_LT(peak, 0.3 * 8 * 1.2);
    c.Send(":WAV:FORM BYTE");
    EXPECT_EQ(ReadBlock(c, ":WAV:DATA?").size(), 1000u);
    c.Send(":ACQ:TYPE PEAK;:DIG;:WAV:FORM WORD;BYT MSBF");
    EXPECT_EQ(c.Query(":WAV:TYPE?"), "PEAK");
    const std::string peak_record = ReadBlock(c, ":WAV:DATA?");
    ASSERT_EQ(peak_record.size(), 4000u);  // min/max pairs
    for (std::size_t i = 0; i < peak_record.size(); i += 4) {
        const auto lo = static_cast<std::int16_t>(static_cast<std::uint8_t>(peak_record[i]) << 8 |
                                                  static_cast<std::uint8_t>(peak_record[i + 1]));
        const auto hi =
            static_cast<std::int16_t>(static_cast<std::uint8_t>(peak_record[i + 2]) << 8 |
                                      static_cast<std::uint8_t>(peak_record[i + 3]));
        EXPECT_LE(lo, hi);
    }
    c.Send(":WAV:SOUR CHAN2;:WAV:DATA?");  // channel 2 was off during the acquisition
    EXPECT_EQ(c.Query("SYST:ERR?"), kConflict);
}

TEST(EmulatorScope, ServedBlockReplacesWaveformData) {
    Session s("QDS2014A");
    const std::string lying("#15\x80\n\x00\xff#", 8);  // payload holds LF and NUL
    s.emu.ServeWaveformData(lying);
    s.client.Send(":WAV:DATA?");
    EXPECT_EQ(s.client.ReadBytes(8), lying);
    EXPECT_EQ(s.client.ReadBytes(1), "\n");
    s.emu.ClearWaveformData();
    s.client.Send(":WAV:DATA?");
    EXPECT_EQ(s.client.Query("SYST:ERR?"), kConflict);
}

// Waveform blocks are kept in memory and sent again: a kept block must never be altered by a
// fault applied to one reply, must still combine with other replies of the same message, and
// must be encoded afresh when the record or the transfer settings change.
TEST(EmulatorScope, KeptBlocksAreSentUnchangedAndFollowNewRecordsAndSettings) {
    Session s("QDS4034A");
    auto& c = s.client;
    const std::string served("#14\x80\n\x00\xff", 7);
    s.emu.ServeWaveformData(served);
    s.emu.GarbleReplies(1);
    c.Send(":WAV:DATA?");
    EXPECT_NE(c.ReadBytes(8), served + "\n");
    c.Send(":WAV:DATA?");
    EXPECT_EQ(c.ReadBytes(8), served + "\n");  // the garbling hit a copy
    c.Send(":WAV:DATA?;*OPC?;:WAV:DATA?");
    EXPECT_EQ(c.ReadBytes(2 * served.size() + 4), served + ";1;" + served + "\n");
    s.emu.ClearWaveformData();

    c.Send(":CHAN1:RANG 8;OFFS 0;:WAV:SOUR CHAN1;:WAV:POIN 1000;:WAV:FORM WORD;UNS 0;BYT MSBF;:DIG");
    const std::string first = ReadBlock(c, ":WAV:DATA?");
    ASSERT_EQ(first.size(), 2000u);
    struct Step {
        const char* message;
        std::size_t size;
        bool same_as_first;
    };
    for (const Step& step : {Step{"", 2000, true}, Step{":WAV:POIN 500", 1000, false},
                             Step{":WAV:POIN 1000", 2000, true}, Step{":WAV:UNS 1", 2000, false},
                             Step{":WAV:UNS 0", 2000, true},
                             Step{":CHAN1:RANG 4;:DIG", 2000, false}}) {
        if (*step.message) c.Send(step.message);
        const std::string block = ReadBlock(c, ":WAV:DATA?");
        EXPECT_EQ(block.size(), step.size) << step.message;
        EXPECT_EQ(block == first, step.same_as_first) << step.message;
    }
    EXPECT_EQ(c.Query("SYST:ERR?"), kNoError);
}

}  // namespace
}  // namespace qn::emu
