#include "Quorlen731XX.h"
#include "core/children.h"
#include "core/features.h"
#include "tests/core/driver_fixture.h"

namespace qn::test {
namespace {

template <class Collection>
std::vector<std::string> Names(Collection* c) {
    LONG n = 0;
    EXPECT_EQ(c->get_Count(&n), S_OK);
    std::vector<std::string> names;
    for (LONG i = 1; i <= n; ++i) {
        com::Bstr s;
        EXPECT_EQ(c->get_Name(i, s.Out()), S_OK);
        names.push_back(s.utf8());
    }
    return names;
}

class ObjectModel : public DriverTest {
protected:
    template <class I>
    ComPtr<I> As() {
        ComPtr<I> p;
        EXPECT_EQ(ComPtr<IIviDriver>(driver_.get()).As(p), S_OK);
        return p;
    }
};

TEST_F(ObjectModel, NavigationNeedsNoSession) {
    auto scope = As<IIviScope>();
    IIviScopeChannels* channels = nullptr;
    ASSERT_EQ(scope->get_Channels(&channels), S_OK);
    LONG n = 0;
    EXPECT_EQ(channels->get_Count(&n), E_IVI_NOT_INITIALIZED);
    channels->Release();
    auto root = As<IQuorlen731XX>();
    IQuorlen731XXTrigger* trigger = nullptr;
    ASSERT_EQ(root->get_Trigger(&trigger), S_OK);
    IQuorlen731XXTriggerPattern* pattern = nullptr;
    EXPECT_EQ(trigger->get_Pattern(&pattern), S_OK);
    pattern->Release();
    trigger->Release();
}

TEST_F(ObjectModel, SimulatedCollections) {
    ASSERT_EQ(Init("", "Simulate=true,DriverSetup=Model=73122A"), S_OK);
    auto channels = As<IIviScopeChannels>();
    EXPECT_EQ(Names(channels.get()),
              (std::vector<std::string>{"Channel1", "Channel2", "Channel3", "Channel4"}));
    IIviScopeChannel* ch = nullptr;
    com::Bstr name("  cHaNnEl2 ");
    ASSERT_EQ(channels->get_Item(name.get(), &ch), S_OK);
    EXPECT_EQ(static_cast<Quorlen731XXChannel*>(ch)->Position(), 2);
    ch->Release();
    com::Bstr bad("Channel5");
    EXPECT_EQ(channels->get_Item(bad.get(), &ch), E_IVI_UNKNOWN_PHYSICAL_IDENTIFIER);
    EXPECT_EQ(ch, nullptr);
    com::Bstr s;
    EXPECT_EQ(channels->get_Name(0, s.Out()), E_IVI_INVALID_VALUE);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Invalid value (0) for method get_Name, parameter Index.");

    auto digital = As<IQuorlen731XXDigitalChannels>();
    auto dnames = Names(digital.get());
    ASSERT_EQ(dnames.size(), 16u);
    EXPECT_EQ(dnames.front(), "UserDigitalChannel0");
    EXPECT_EQ(dnames.back(), "UserDigitalChannel15");
    auto measurements = As<IQuorlen731XXMeasurements>();
    auto mnames = Names(measurements.get());
    ASSERT_EQ(mnames.size(), 24u);
    EXPECT_EQ(mnames[4], "UserChannel1");
    EXPECT_EQ(mnames[8], "UserDigitalChannel0");
    EXPECT_EQ(driver_->Core().repcaps.digital_measurements.first, 9);
    EXPECT_EQ(driver_->Core().repcaps.digital_measurements.last, 24);
    EXPECT_FALSE(driver_->Core().repcaps.math_measurements.Contains(1));

    // The simulated feature record follows the model's fixed rules.
    const FeatureRecord& f = driver_->Core().features;
    EXPECT_EQ(f.analog_channel_count, 2);
    EXPECT_EQ(f.digital_channel_count, 0);
    EXPECT_TRUE(f.early_family);
    EXPECT_FALSE(f.sequence_trigger);
}

TEST_F(ObjectModel, VirtualNamesFromTheStore) {
    WriteStore(R"(<IviConfigurationStore>
      <DriverSession name="Bench" simulate="true">
        <VirtualName name="Probe" mapTo="UserChannel3"/>
        <VirtualName name="Ch" mapTo="Channel"><Range start="1" end="4" physicalStart="1"/></VirtualName>
        <VirtualName name="Alias" mapTo="Probe"/>
      </DriverSession></IviConfigurationStore>)");
    ASSERT_EQ(Init("Bench", ""), S_OK) << ErrorText();
    auto user = As<IQuorlen731XXChannels>();
    IQuorlen731XXChannel* ch = nullptr;
    com::Bstr probe("PROBE");
    ASSERT_EQ(user->get_Item(probe.get(), &ch), S_OK);
    EXPECT_EQ(static_cast<Quorlen731XXUserChannel*>(ch)->Position(), 3);
    ch->Release();
    com::Bstr alias("alias");  // translated twice
    ASSERT_EQ(user->get_Item(alias.get(), &ch), S_OK);
    ch->Release();
    auto cc = As<IIviScopeChannels>();
    IIviScopeChannel* c = nullptr;
    com::Bstr ch4("ch4");
    ASSERT_EQ(cc->get_Item(ch4.get(), &c), S_OK);
    EXPECT_EQ(static_cast<Quorlen731XXChannel*>(c)->Position(), 4);
    c->Release();
}

TEST_F(ObjectModel, ChildrenOutliveTheRootSafely) {
    ASSERT_EQ(Init("", "Simulate=true"), S_OK);
    IQuorlen731XXChannel* ch = nullptr;
    {
        auto user = As<IQuorlen731XXChannels>();
        com::Bstr n("UserChannel1");
        ASSERT_EQ(user->get_Item(n.get(), &ch), S_OK);
    }
    driver_.reset();  // the last reference to the root
    EXPECT_EQ(ch->Release(), 0u);
}

TEST_F(ObjectModel, SimulatedValuesAreKeptPerObjectAndInterface) {
    ASSERT_EQ(Init("", "Simulate=true"), S_OK);
    auto cc = As<IIviScopeAcquisition>();
    auto is = As<IQuorlen731XXAcquisition>();
    const auto values = [&] {
        double a = -1, b = -1;
        EXPECT_EQ(cc->get_TimePerRecord(&a), S_OK);
        EXPECT_EQ(is->get_TimePerRecord(&b), S_OK);
        return std::pair(a, b);
    };
    EXPECT_EQ(values(), std::pair(0.001, 0.0));
    EXPECT_EQ(cc->put_TimePerRecord(2.5), S_OK);
    EXPECT_EQ(values(), std::pair(2.5, 0.0));
    EXPECT_EQ(driver_->InvalidateAllAttributes(), S_OK);
    EXPECT_EQ(values(), std::pair(0.001, 0.0));
    EXPECT_EQ(cc->put_TimePerRecord(7), S_OK);
    EXPECT_EQ(driver_->Reset(), S_OK);
    EXPECT_EQ(values(), std::pair(0.001, 0.0));
    EXPECT_EQ(cc->get_TimePerRecord(nullptr), E_IVI_NULL_POINTER);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Null pointer passed for method get_TimePerRecord, parameter val.");
}

}  // namespace
}  // namespace qn::test
