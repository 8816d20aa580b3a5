// Triggering against the emulator over a loopback socket: an edge trigger at
// a level and slope puts the crossing at the trigger point of the fetched
// record; a level the signal never reaches leaves a normal-sweep acquisition
// pending until the sweep triggers by itself.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <vector>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "tests/scope/scope_fixture.h"
#include "tests/support/emulator_driver.h"

namespace qn::test {
namespace {

class TriggerOnEmulator : public ::testing::Test, protected EmulatedDriver {
protected:
    void Start(const char* model, const char* options = "QueryInstrStatus=true") {
        ASSERT_EQ(Open(model, options, true, true), S_OK) << ErrorText();
    }
    IQuorlen731XXTrigger* Trig() { return driver.get(); }
};

TEST_F(TriggerOnEmulator, EdgeTriggerPutsTheCrossingAtTheTriggerPoint) {
    struct Case {
        int channel;  // odd channels carry a sine, even ones a square wave
        double level;
        Quorlen731XXTriggerSlopeEnum slope;
        double position;  // s, trigger point relative to the reference
    };
    const Case cases[] = {
        {1, 1.0, Quorlen731XXTriggerSlopePositive, 0.0},
        {1, -0.5, Quorlen731XXTriggerSlopeNegative, 2e-4},
        {2, 0.5, Quorlen731XXTriggerSlopePositive, -1e-4},
        {2, -1.5, Quorlen731XXTriggerSlopeNegative, 0.0},
    };
    Start("QDS4032A");
    for (const Case& c : cases) {
        const std::string channel = "UserChannel" + std::to_string(c.channel);
        SCOPED_TRACE(channel + " at " + std::to_string(c.level));
        auto ch = ChannelNamed<IQuorlen731XXChannels, IQuorlen731XXChannel>(*driver.get(),
                                                                            channel.c_str());
        com::Bstr name(channel);
        ASSERT_EQ(ch->put_Enabled(VARIANT_TRUE), S_OK) << ErrorText();
        ASSERT_EQ(static_cast<IQuorlen731XXAcquisition*>(driver.get())->put_StartTime(
                      c.position - 5e-4),
                  S_OK)
            << ErrorText();
        IQuorlen731XXTriggerEdge* edge = driver.get();
        ASSERT_EQ(Trig()->put_Type(Quorlen731XXTriggerEdge), S_OK) << ErrorText();
        ASSERT_EQ(edge->Configure(name.get(), c.level, c.slope), S_OK) << ErrorText();
        ASSERT_EQ(Trig()->put_Modifier(Quorlen731XXTriggerModifierNone), S_OK) << ErrorText();

        SAFEARRAY* a = nullptr;
        double x0 = 0, dx = 0;
        auto m = ChannelNamed<IIviScopeMeasurements, IIviScopeMeasurement>(
            *driver.get(), ("Channel" + std::to_string(c.channel)).c_str());
        ASSERT_EQ(m->ReadWaveform(5000, &a, &x0, &dx), S_OK) << ErrorText();
        com::SafeArray owner(a);
        const std::vector<double> v(owner.data<double>(), owner.data<double>() + owner.size());
        ASSERT_GT(dx, 0.0);
        const long at = std::lround(-x0 / dx);  // the sample at time 0
        const long k = static_cast<long>(v.size() / 100);
        ASSERT_TRUE(at - k >= 0 && at + k < static_cast<long>(v.size())) << x0 << " " << dx;
        const double before = v[static_cast<std::size_t>(at - k)];
        const double after = v[static_cast<std::size_t>(at + k)];
        if (c.slope == Quorlen731XXTriggerSlopePositive) {
            EXPECT_LT(before, c.level);
            EXPECT_GT(after, c.level);
        } else {
            EXPECT_GT(before, c.level);
            EXPECT_LT(after, c.level);
        }
        if (c.channel % 2 == 1) {
            EXPECT_NEAR(v[static_cast<std::size_t>(at)], c.level, 0.15);
        }
        ASSERT_EQ(ch->put_Enabled(VARIANT_FALSE), S_OK);
    }
}

TEST_F(TriggerOnEmulator, AnUnreachedLevelLeavesTheAcquisitionPending) {
    // No status checks: their event-status reads would take the completion
    // event that Status waits for.
    Start("QDS4032A", "");
    IQuorlen731XXTriggerEdge* edge = driver.get();
    com::Bstr ch1("UserChannel1");
    ASSERT_EQ(edge->Configure(ch1.get(), 5.0, Quorlen731XXTriggerSlopePositive), S_OK)
        << ErrorText();
    ASSERT_EQ(Trig()->put_Modifier(Quorlen731XXTriggerModifierNone), S_OK);
    auto* acquisition = static_cast<IQuorlen731XXMeasurements*>(driver.get());
    // The digitize command returns once the acquisition time has passed.
    ASSERT_EQ(acquisition->Initiate(), S_OK) << ErrorText();
    Quorlen731XXAcquisitionStatusEnum status = Quorlen731XXAcqStatusUnknown;
    ASSERT_EQ(acquisition->Status(&status), S_OK);
    EXPECT_EQ(status, Quorlen731XXAcqInProgress);
    ASSERT_EQ(acquisition->Status(&status), S_OK);
    EXPECT_EQ(status, Quorlen731XXAcqInProgress);
    // The automatic sweep triggers without the event.
    ASSERT_EQ(Trig()->put_Modifier(Quorlen731XXTriggerModifierAuto), S_OK);
    ASSERT_EQ(acquisition->Status(&status), S_OK);
    EXPECT_EQ(status, Quorlen731XXAcqComplete);
}

TEST_F(TriggerOnEmulator, EveryTriggerTypeRoundTripsThroughTheInstrument) {
    Start("QMS4034A");
    com::Bstr ch2("UserChannel2");
    using T = IQuorlen731XXTrigger;
    using G = IQuorlen731XXTriggerGlitch;
    using W = IQuorlen731XXTriggerWidth;
    using V = IQuorlen731XXTriggerTv;
    T* trig = driver.get();
    G* glitch = driver.get();
    W* width = driver.get();
    V* tv = driver.get();

    ASSERT_EQ(trig->put_Source(ch2.get()), S_OK) << ErrorText();
    ASSERT_EQ(trig->put_Level(-0.125), S_OK) << ErrorText();
    ASSERT_EQ(trig->put_Holdoff(1e-6), S_OK) << ErrorText();
    ASSERT_EQ(trig->put_Coupling(Quorlen731XXTriggerCouplingHFReject), S_OK) << ErrorText();
    EXPECT_EQ(Got(trig, &T::get_Level), -0.125);
    EXPECT_EQ(Got(trig, &T::get_Holdoff), 1e-6);
    EXPECT_EQ(Got(trig, &T::get_Coupling), Quorlen731XXTriggerCouplingHFReject);
    ASSERT_EQ(trig->put_Coupling(Quorlen731XXTriggerCouplingNoiseReject), S_OK);
    EXPECT_EQ(Got(trig, &T::get_Coupling), Quorlen731XXTriggerCouplingNoiseReject);

    ASSERT_EQ(glitch->Configure(ch2.get(), 0.25, 5e-7, Quorlen731XXGlitchNegative,
                                Quorlen731XXGlitchGreaterThan),
              S_OK)
        << ErrorText();
    ASSERT_EQ(trig->put_Type(Quorlen731XXTriggerGlitch), S_OK) << ErrorText();
    EXPECT_EQ(Got(glitch, &G::get_Width), 5e-7);
    EXPECT_EQ(Got(glitch, &G::get_condition), Quorlen731XXGlitchGreaterThan);
    EXPECT_EQ(Got(trig, &T::get_Source), "UserChannel2");

    ASSERT_EQ(width->Configure(ch2.get(), 0.25, 1e-6, 3e-6, Quorlen731XXWidthNegative,
                               Quorlen731XXWidthOutside),
              S_OK)
        << ErrorText();
    ASSERT_EQ(trig->put_Type(Quorlen731XXTriggerWidth), S_OK) << ErrorText();
    EXPECT_EQ(Got(width, &W::get_ThresholdLow), 1e-6);
    EXPECT_EQ(Got(width, &W::get_ThresholdHigh), 3e-6);

    ASSERT_EQ(tv->Configure(ch2.get(), Quorlen731XXTVSignalFormatNTSC,
                            Quorlen731XXTVEventLineNumber, Quorlen731XXTVTriggerPositive),
              S_OK)
        << ErrorText();
    ASSERT_EQ(trig->put_Type(Quorlen731XXTriggerTV), S_OK) << ErrorText();
    ASSERT_EQ(tv->put_LineNumber(300), S_OK) << ErrorText();
    EXPECT_EQ(Got(tv, &V::get_LineNumber), 300);
    EXPECT_EQ(Got(tv, &V::get_Event), Quorlen731XXTVEventLineNumber);

    IQuorlen731XXTriggerPattern* pattern = driver.get();
    ASSERT_EQ(pattern->Configure(1, 3, 0x80, 0x81, Quorlen731XXPatternEnter), S_OK);
    ASSERT_EQ(trig->put_Type(Quorlen731XXTriggerPattern), S_OK) << ErrorText();
    com::Bstr dig("UserDigitalChannel3");
    ASSERT_EQ(static_cast<IQuorlen731XXTriggerState*>(driver.get())->put_ClockSource(dig.get()),
              S_OK)
        << ErrorText();
    const auto sent = emu->ReceivedMessages();
    EXPECT_EQ(sent.end()[-2], ":TRIG:PATT 0,0,DIG3,POS;:TRIG:MODE PATT");  // then *ESR?
}

}  // namespace
}  // namespace qn::test
