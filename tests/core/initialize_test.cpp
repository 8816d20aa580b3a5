#include "tests/core/driver_fixture.h"

namespace qn::test {
namespace {

TEST_F(DriverTest, SimulationDefaultsToTheDefaultModel) {
    ASSERT_EQ(Init("", "Simulate=true"), S_OK);
    EXPECT_TRUE(Initialized());
    EXPECT_EQ(Text(&IIviDriverIdentity::get_InstrumentModel), "QDS4032A");
    EXPECT_EQ(Text(&IIviDriverIdentity::get_InstrumentManufacturer), "Quorlen Technologies");
    EXPECT_EQ(Text(&IIviDriverIdentity::get_InstrumentFirmwareRevision), "Sim1.3.20.0");
    EXPECT_EQ(Init("", "Simulate=true"), E_IVI_ALREADY_INITIALIZED);
    EXPECT_EQ(ErrorText(), "Quorlen731XX: The driver is already initialized.");
    EXPECT_TRUE(Initialized());
    EXPECT_EQ(driver_->Close(), S_OK);
    EXPECT_EQ(driver_->Close(), E_IVI_NOT_INITIALIZED);
    // A closed session may be initialized again.
    EXPECT_EQ(Init("", "Simulate=true,DriverSetup=Model=QMS3104A"), S_OK);
    EXPECT_EQ(Text(&IIviDriverIdentity::get_InstrumentModel), "QMS3104A");
}

TEST_F(DriverTest, NullResourceAndBadOptionsLeaveTheSessionClosed) {
    EXPECT_EQ(driver_->Initialize(nullptr, VARIANT_FALSE, VARIANT_FALSE, nullptr),
              E_IVI_INVALID_VALUE);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Invalid value (0) for method Initialize, parameter "
              "bstrResourceDescriptor.");
    EXPECT_EQ(Init("", "Simulate=yes"), E_IVI_BAD_OPTION_VALUE);
    EXPECT_NE(ErrorText().find("The yes value"), std::string::npos);
    EXPECT_FALSE(Initialized());
}

TEST_F(DriverTest, IdQueryChecksTheExactModel) {
    EXPECT_EQ(Init("", "Simulate=true,DriverSetup=Model=qds4032a", /*id_query=*/true),
              E_IVI_ID_QUERY_FAILED);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Instrument ID query failed.\r\nUnrecognized model: qds4032a.");
    EXPECT_FALSE(Initialized());
    EXPECT_EQ(Init("", "Simulate=true,DriverSetup=Model=73122A", true), S_OK);
}

TEST_F(DriverTest, InterchangeCheckFailsInitializeAfterwards) {
    EXPECT_EQ(Init("", "Simulate=true,InterchangeCheck=true", false, /*reset=*/true),
              E_IVI_BAD_OPTION_VALUE);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: The true value in the option string is unknown.\r\nInterchange "
              "check is not supported by the driver.");
    EXPECT_FALSE(Initialized());
}

TEST_F(DriverTest, WithoutSimulationAnUnreachableResourceIsUnknown) {
    // Port 1 on loopback: nothing listens, the connection is refused at once.
    EXPECT_EQ(Init("TCPIP0::127.0.0.1::1::SOCKET", ""), E_IVI_RESOURCE_UNKNOWN);
    EXPECT_FALSE(Initialized());
}

TEST_F(DriverTest, StoreSessionSuppliesFlagsSetupAndSettings) {
    WriteStore(R"(<?xml version="1.0"?>
<IviConfigurationStore>
  <HardwareAsset name="Bench" resourceDescriptor="TCPIP0::127.0.0.1::INSTR"/>
  <DriverSession name="S1" hardwareAsset="Bench" simulate="true" rangeCheck="false">
    <DriverSetup>Model=QMS3104A, Trace=false</DriverSetup>
    <VirtualName name="Ch" mapTo="Channel"><Range start="1" end="2" physicalStart="1"/></VirtualName>
    <DataComponent name="Configurable Initial Settings" type="Structure">
      <DataComponent name=" Points " type="Integer" value="1000"/>
      <DataComponent name="Gain" type="Real" value="2.5"/>
      <DataComponent name="Nested" type="Structure"/>
    </DataComponent>
  </DriverSession>
  <LogicalName name="MyScope" session="S1"/>
</IviConfigurationStore>)");
    ASSERT_EQ(Init("MyScope", "Cache=false"), S_OK) << ErrorText();
    const DriverSession& s = driver_->Core().session;
    EXPECT_EQ(s.logical_name, "MyScope");
    EXPECT_EQ(s.io_resource_descriptor, "TCPIP0::127.0.0.1::INSTR");
    EXPECT_TRUE(s.flags.simulate);
    EXPECT_FALSE(s.flags.range_check);
    EXPECT_FALSE(s.flags.cache);  // the option string is applied last
    EXPECT_EQ(s.model, "QMS3104A");
    EXPECT_EQ(std::get<long>(s.initial_settings.at("points")), 1000);
    EXPECT_EQ(std::get<double>(s.initial_settings.at("gain")), 2.5);
    EXPECT_EQ(s.initial_settings.count("nested"), 0u);
    EXPECT_EQ(driver_->Core().virtual_names.at("ch2"), "Channel2");
}

TEST_F(DriverTest, StoreWithoutSessionNeedsTheSoftwareModule) {
    WriteStore("<IviConfigurationStore/>");
    EXPECT_EQ(Init("", "Simulate=true"), E_IVI_CANNOT_RECOVER);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Failure cannot recover.\r\nSoftware module could not be loaded from "
              "the IVI Configuration Store.");
    EXPECT_FALSE(Initialized());

    WriteStore(R"(<IviConfigurationStore><SoftwareModule name="Qn731XX">
      <DataComponent name="Configurable Initial Settings" type="Structure">
        <DataComponent name="Model" type="String" value="QDS2014A"/>
      </DataComponent></SoftwareModule></IviConfigurationStore>)");
    ASSERT_EQ(Init("", "Simulate=true"), S_OK);
    EXPECT_EQ(Text(&IIviDriverIdentity::get_InstrumentModel), "QDS2014A");
    ASSERT_EQ(driver_->Close(), S_OK);
    ASSERT_EQ(Init("", "Simulate=true,DriverSetup=Model=QDS2012A"), S_OK);
    EXPECT_EQ(Text(&IIviDriverIdentity::get_InstrumentModel), "QDS2012A");
}

TEST_F(DriverTest, MalformedStoreIsAClearError) {
    WriteStore("<IviConfigurationStore><DriverSession name='x'></IviConfigurationStore>");
    EXPECT_EQ(Init("", "Simulate=true"), E_IVI_INVALID_FILE_FORMAT);
    std::string text = ErrorText();
    EXPECT_NE(text.find("Invalid file format.\r\n"), std::string::npos) << text;
    EXPECT_NE(text.find("store.xml"), std::string::npos) << text;
    EXPECT_FALSE(Initialized());
}

TEST_F(DriverTest, SnapshotGuardsTheSimulationState) {
    ASSERT_EQ(Init("", "Simulate=true"), S_OK);
    EXPECT_EQ(driver_->put_Simulate(VARIANT_FALSE), E_IVI_CANNOT_CHANGE_SIMULATION_STATE);
    VARIANT_BOOL b = 0;
    driver_->get_Simulate(&b);
    EXPECT_EQ(b, VARIANT_TRUE);
    EXPECT_EQ(driver_->put_InterchangeCheck(VARIANT_FALSE), S_OK);
    EXPECT_EQ(driver_->put_InterchangeCheck(VARIANT_TRUE), E_IVI_VALUE_NOT_SUPPORTED);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Does not support this class-compliant feature:  (enumeration) value "
              "VARIANT_TRUE passed as the value for parameter bInterchangeCheck in method "
              "put_InterchangeCheck.");
    driver_->get_InterchangeCheck(&b);
    EXPECT_EQ(b, VARIANT_FALSE);
    // ResetWithDefaults restores the flags taken at Initialize.
    driver_->put_RangeCheck(VARIANT_FALSE);
    EXPECT_EQ(driver_->ResetWithDefaults(), S_OK);
    driver_->get_RangeCheck(&b);
    EXPECT_EQ(b, VARIANT_TRUE);
}

TEST_F(DriverTest, SimulatedUtilityOperations) {
    ASSERT_EQ(Init("", "Simulate=true"), S_OK);
    LONG code = -1;
    com::Bstr msg;
    EXPECT_EQ(driver_->ErrorQuery(&code, msg.Out()), S_OK);
    EXPECT_EQ(code, 0);
    EXPECT_EQ(msg.utf8(), "No error.");
    EXPECT_EQ(driver_->SelfTest(&code, msg.Out()), S_OK);
    EXPECT_EQ(msg.utf8(), "Selftest passed");
    EXPECT_EQ(driver_->Reset(), S_OK);
    EXPECT_EQ(driver_->Disable(), S_OK);
    EXPECT_EQ(driver_->LockObject(), E_IVI_METHOD_NOT_SUPPORTED);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Does not support this class-compliant feature: method LockObject");
    EXPECT_EQ(driver_->put_RecordCoercions(VARIANT_TRUE), S_OK);
    EXPECT_EQ(driver_->GetNextCoercionRecord(msg.Out()), S_OK);
    EXPECT_EQ(msg.utf8(), "");
}

}  // namespace
}  // namespace qn::test
