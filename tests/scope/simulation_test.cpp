// Simulated acquisition and channel properties: the initial values of both
// interfaces, write-then-read, and the independence of the stores of the
// class-compliant and instrument-specific interfaces and of the channels.
#include <gtest/gtest.h>

#include <vector>

#include "tests/scope/property_rows.h"
#include "tests/scope/scope_fixture.h"

namespace qn::test {
namespace {

void ExpectInitial(const std::vector<PropertyRow>& rows) {
    for (const PropertyRow& r : rows) {
        double v = -12345;
        EXPECT_EQ(r.get(&v), S_OK) << r.name;
        EXPECT_EQ(v, r.initial) << r.name;
    }
}
void WriteAndReadBack(const std::vector<PropertyRow>& rows) {
    for (const PropertyRow& r : rows) {
        if (!r.put) continue;
        EXPECT_EQ(r.put(r.written), S_OK) << r.name;
        double v = -12345;
        EXPECT_EQ(r.get(&v), S_OK) << r.name;
        EXPECT_EQ(v, r.written) << r.name;
    }
}

std::vector<PropertyRow> IviAcquisitionRows(IIviScopeAcquisition* a) {
    using I = IIviScopeAcquisition;
    return {
        Row("TimePerRecord", a, &I::get_TimePerRecord, &I::put_TimePerRecord, 0.001, 0.5),
        Row("StartTime", a, &I::get_StartTime, &I::put_StartTime, -0.0005, 0.25),
        Row("NumberOfPointsMin", a, &I::get_NumberOfPointsMin, &I::put_NumberOfPointsMin, 1000,
            4000),
        Row("Interpolation", a, &I::get_Interpolation, &I::put_Interpolation, 1, 2),
        Row("NumberOfAverages", a, &I::get_NumberOfAverages, &I::put_NumberOfAverages, 8, 64),
    };
}

// Instrument-specific acquisition; the forwarded class-compliant reads of
// the members without their own simulated value see the same values.
std::vector<PropertyRow> AcquisitionRows(IQuorlen731XXAcquisition* a, IIviScopeAcquisition* c) {
    using I = IQuorlen731XXAcquisition;
    using C = IIviScopeAcquisition;
    return {
        Row("TimePerRecord", a, &I::get_TimePerRecord, &I::put_TimePerRecord, 0, 0.02),
        Row("StartTime", a, &I::get_StartTime, &I::put_StartTime, 0, -0.01),
        Row("NumberOfPointsMin", a, &I::get_NumberOfPointsMin, &I::put_NumberOfPointsMin, 0,
            2000),
        ReadOnly("RecordLength", a, &I::get_RecordLength, 1000),
        ReadOnly("SampleRate", a, &I::get_SampleRate, 1e6),
        ReadOnly("SampleMode", a, &I::get_SampleMode, 0),
        Row("Interpolation", a, &I::get_Interpolation, &I::put_Interpolation, 1, 2),
        Row("Type", a, &I::get_Type, &I::put_Type, 0, 1),
        Row("NumberOfAverages", a, &I::get_NumberOfAverages, &I::put_NumberOfAverages, 0, 16),
        ReadOnly("IIviScope RecordLength", c, &C::get_RecordLength, 1000),
        ReadOnly("IIviScope SampleRate", c, &C::get_SampleRate, 1e6),
        ReadOnly("IIviScope SampleMode", c, &C::get_SampleMode, 0),
        Row("IIviScope Type", c, &C::get_Type, &C::put_Type, 0, 4),
    };
}

std::vector<PropertyRow> IviChannelRows(IIviScopeChannel* ch, double k) {
    using I = IIviScopeChannel;
    return {
        Row("Range", ch, &I::get_Range, &I::put_Range, 40, 2 * k),
        Row("Offset", ch, &I::get_Offset, &I::put_Offset, 0, 0.1 * k),
        Row("Coupling", ch, &I::get_Coupling, &I::put_Coupling, 0, k > 1 ? 2 : 1),
        Row("InputImpedance", ch, &I::get_InputImpedance, &I::put_InputImpedance, 1e6, 50),
        Row("InputFrequencyMax", ch, &I::get_InputFrequencyMax, &I::put_InputFrequencyMax, 1e8,
            2e7 * k),
        Row("ProbeAttenuation", ch, &I::get_ProbeAttenuation, &I::put_ProbeAttenuation, 1,
            10 * k),
        ReadOnly("ProbeSense", ch, &I::get_ProbeSense, 1),
    };
}

std::vector<PropertyRow> ChannelRows(IQuorlen731XXChannel* ch, double k) {
    using I = IQuorlen731XXChannel;
    return {
        Row("Enabled", ch, &I::get_Enabled, &I::put_Enabled, -1, 0),
        Row("Range", ch, &I::get_Range, &I::put_Range, 40, 3 * k),
        Row("Offset", ch, &I::get_Offset, &I::put_Offset, 0, -0.2 * k),
        Row("Coupling", ch, &I::get_Coupling, &I::put_Coupling, 0, k > 1 ? 1 : 2),
        Row("InputImpedance", ch, &I::get_InputImpedance, &I::put_InputImpedance, 1e6, 50),
        Row("InputFrequencyMax", ch, &I::get_InputFrequencyMax, &I::put_InputFrequencyMax, 1e8,
            1e9),
        Row("ProbeAttenuation", ch, &I::get_ProbeAttenuation, &I::put_ProbeAttenuation, 1,
            100 * k),
        ReadOnly("ProbeSense", ch, &I::get_ProbeSense, 1),
        Row("ProbeSkew", ch, &I::get_ProbeSkew, &I::put_ProbeSkew, 0, 1e-9 * k),
        ReadOnly("Protection", ch, &I::get_Protection, 0),
        Row("Units", ch, &I::get_Units, &I::put_Units, 0, 1),
        Row("Invert", ch, &I::get_Invert, &I::put_Invert, 0, -1),
    };
}

class SimulatedScope : public ::testing::Test {
protected:
    void Open(const char* model) { driver_ = SimulatedDriver(model); }
    ComPtr<IQuorlen731XXChannel> User(int n) {
        return ChannelNamed<IQuorlen731XXChannels, IQuorlen731XXChannel>(
            *driver_.get(), ("UserChannel" + std::to_string(n)).c_str());
    }
    ComPtr<IIviScopeChannel> Ivi(int n) {
        return ChannelNamed<IIviScopeChannels, IIviScopeChannel>(
            *driver_.get(), ("Channel" + std::to_string(n)).c_str());
    }

    ComPtr<Quorlen731XX> driver_;
};

TEST_F(SimulatedScope, AcquisitionStoresOfBothInterfacesAreIndependent) {
    Open("QDS4032A");
    auto ivi = IviAcquisitionRows(driver_.get());
    auto specific = AcquisitionRows(driver_.get(), driver_.get());
    ExpectInitial(ivi);
    ExpectInitial(specific);
    WriteAndReadBack(ivi);
    ExpectInitial(specific);
    WriteAndReadBack(specific);
    for (PropertyRow& r : ivi) r.initial = r.written;
    ExpectInitial(ivi);
    // The forwarded Type writes the instrument-specific value.
    EXPECT_EQ(Got(driver_.get(), &IQuorlen731XXAcquisition::get_Type),
              Quorlen731XXAcquisitionTypeAverage);
}

TEST_F(SimulatedScope, ConfigureRecordWritesTheInstrumentSpecificSettings) {
    Open("QDS4032A");
    IIviScopeAcquisition* ivi = driver_.get();
    IQuorlen731XXAcquisition* acq = driver_.get();
    using A = IQuorlen731XXAcquisition;
    ASSERT_EQ(ivi->ConfigureRecord(0.01, 500, -0.002), S_OK);
    EXPECT_EQ(Got(acq, &A::get_TimePerRecord), 0.01);
    EXPECT_EQ(Got(acq, &A::get_NumberOfPointsMin), 500);
    EXPECT_EQ(Got(acq, &A::get_StartTime), -0.002);
    EXPECT_EQ(Got(ivi, &IIviScopeAcquisition::get_TimePerRecord), 0.001);
    // Envelopes fail in simulation too.
    LONG n = 0;
    EXPECT_EQ(ivi->get_NumberOfEnvelopes(&n), E_QUORLEN731XX_MODEL_NOT_SUPPORTED);
}

TEST_F(SimulatedScope, ChannelStoresAreIndependentPerChannelAndInterface) {
    Open("QDS4034A");
    auto user1 = ChannelRows(User(1).get(), 1), user2 = ChannelRows(User(2).get(), 2);
    auto ivi1 = IviChannelRows(Ivi(1).get(), 1), ivi2 = IviChannelRows(Ivi(2).get(), 2);
    for (auto* rows : {&user1, &user2, &ivi1, &ivi2}) ExpectInitial(*rows);
    WriteAndReadBack(user1);
    ExpectInitial(user2);
    ExpectInitial(ivi1);
    WriteAndReadBack(ivi2);
    ExpectInitial(ivi1);
    ExpectInitial(user2);
    WriteAndReadBack(user2);
    for (PropertyRow& r : user1) r.initial = r.written;
    ExpectInitial(user1);

    // The class-compliant Enabled is the user channel's.
    EXPECT_EQ(Got(Ivi(1).get(), &IIviScopeChannel::get_Enabled), VARIANT_FALSE);
    EXPECT_EQ(Got(User(3).get(), &IQuorlen731XXChannel::get_Label), "\"1\"");
}

TEST_F(SimulatedScope, MethodsRunWithoutAnInstrument) {
    Open("73122A");  // no protection, no ground coupling, no 50-ohm input
    EXPECT_EQ(User(2)->ClearProtection(), S_OK);
    // Simulated writes are stored as given, without the model's checks.
    ASSERT_EQ(Ivi(2)->Configure(5.0, 1.0, IviScopeVerticalCouplingGnd, 10.0, VARIANT_FALSE), S_OK);
    ASSERT_EQ(Ivi(2)->ConfigureCharacteristics(50.0, 2e7), S_OK);
    EXPECT_EQ(Got(User(2).get(), &IQuorlen731XXChannel::get_Coupling),
              Quorlen731XXVerticalCouplingGnd);
    EXPECT_EQ(Got(User(2).get(), &IQuorlen731XXChannel::get_InputImpedance), 50.0);
    EXPECT_EQ(Got(Ivi(2).get(), &IIviScopeChannel::get_Range), 40.0);
}

}  // namespace
}  // namespace qn::test
