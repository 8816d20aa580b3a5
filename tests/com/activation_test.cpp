// Activation of the driver the way a client program does it: this test links
// only the platform layer and finds the driver through the registry store.
// The module is opened with dlopen just to call its registration entry points.
#include "platform/com/activation.h"

#include <gtest/gtest.h>

#include <string>

#include "IviDriver.h"
#include "IviScope.h"
#include "Quorlen731XXIds.h"
#include "emulator/emulator.h"
#include "tests/com/module_fixture.h"

namespace {

using qn::test::CallModule;

class DriverActivation : public qn::test::RegistryFileTest {
  protected:
    void SetUp() override {
        RegistryFileTest::SetUp();
        ::setenv("IVI_CONFIG_STORE", (dir_ + "/store.xml").c_str(), 1);  // absent
        ASSERT_EQ(CallModule("DllRegisterServer"), S_OK);
    }
    void TearDown() override {
        EXPECT_EQ(CallModule("DllUnregisterServer"), S_OK);
        CoFreeUnusedLibraries();
        ::unsetenv("IVI_CONFIG_STORE");
        RegistryFileTest::TearDown();
    }
};

// Opens a simulated session, checks the identity and closes it again.
void UseSimulatedSession(IIviDriver* driver) {
    qn::com::Bstr resource(""), options("Simulate=true");
    ASSERT_EQ(driver->Initialize(resource.get(), VARIANT_FALSE, VARIANT_FALSE, options.get()),
              S_OK);
    ComPtr<IIviDriverIdentity> identity;
    ASSERT_EQ(driver->QueryInterface(iid_of<IIviDriverIdentity>, identity.OutVoid()), S_OK);
    qn::com::Bstr model, identifier;
    EXPECT_EQ(identity->get_InstrumentModel(model.Out()), S_OK);
    EXPECT_EQ(model.utf8(), "QDS4032A");
    EXPECT_EQ(identity->get_Identifier(identifier.Out()), S_OK);
    EXPECT_EQ(identifier.utf8(), "Quorlen731XX");
    EXPECT_EQ(driver->Close(), S_OK);
}

TEST_F(DriverActivation, CreatesTheDriverByProgIdAndByClsid) {
    for (const char16_t* progid : {u"Quorlen731XX.Quorlen731XX", u"Quorlen731XX.Quorlen731XX.1"}) {
        CLSID clsid = GUID_NULL;
        EXPECT_EQ(CLSIDFromProgID(progid, &clsid), S_OK);
        EXPECT_EQ(clsid, CLSID_Quorlen731XX);
    }
    CLSID clsid = GUID_NULL;
    ASSERT_EQ(CLSIDFromProgID(u"Quorlen731XX.Quorlen731XX", &clsid), S_OK);
    ComPtr<IIviDriver> driver;
    ASSERT_EQ(CoCreateInstance(clsid, nullptr, CLSCTX_INPROC_SERVER, iid_of<IIviDriver>,
                               driver.OutVoid()),
              S_OK);
    UseSimulatedSession(driver.get());
    CoFreeUnusedLibraries();  // an object is alive: the module stays
    VARIANT_BOOL initialized = VARIANT_TRUE;
    EXPECT_EQ(driver->get_Initialized(&initialized), S_OK);
    EXPECT_EQ(initialized, VARIANT_FALSE);
    driver.reset();
    CoFreeUnusedLibraries();

    // Again by CLSID, through IUnknown, once the unused module may have gone.
    ComPtr<IUnknown> unknown;
    ASSERT_EQ(CoCreateInstance(CLSID_Quorlen731XX, nullptr, CLSCTX_ALL, iid_of<IUnknown>,
                               unknown.OutVoid()),
              S_OK);
    ASSERT_EQ(unknown.As(driver), S_OK);
    unknown.reset();
    UseSimulatedSession(driver.get());
}

// The whole client flow: by ProgID, against an instrument (the emulator on a
// loopback socket), reading a collection and the identity.
TEST_F(DriverActivation, AClientDrivesAnInstrumentThroughTheProgId) {
    qn::emu::Emulator emu("QMS3104A");
    const std::uint16_t port = emu.Start();
    CLSID clsid = GUID_NULL;
    ASSERT_EQ(CLSIDFromProgID(u"Quorlen731XX.Quorlen731XX", &clsid), S_OK);
    ComPtr<IIviDriver> driver;
    ASSERT_EQ(CoCreateInstance(clsid, nullptr, CLSCTX_ALL, iid_of<IIviDriver>, driver.OutVoid()),
              S_OK);
    qn::com::Bstr resource("TCPIP0::127.0.0.1::" + std::to_string(port) + "::SOCKET"), options("");
    ASSERT_EQ(driver->Initialize(resource.get(), VARIANT_TRUE, VARIANT_FALSE, options.get()), S_OK);
    ComPtr<IIviScopeChannels> channels;
    ASSERT_EQ(driver->QueryInterface(iid_of<IIviScopeChannels>, channels.OutVoid()), S_OK);
    LONG count = 0;
    EXPECT_EQ(channels->get_Count(&count), S_OK);
    EXPECT_EQ(count, 4);
    qn::com::Bstr name;
    EXPECT_EQ(channels->get_Name(1, name.Out()), S_OK);
    EXPECT_EQ(name.utf8(), "Channel1");
    ComPtr<IIviDriverIdentity> identity;
    ASSERT_EQ(driver->QueryInterface(iid_of<IIviDriverIdentity>, identity.OutVoid()), S_OK);
    qn::com::Bstr model, maker;
    EXPECT_EQ(identity->get_InstrumentModel(model.Out()), S_OK);
    EXPECT_EQ(model.utf8(), "QMS3104A");
    EXPECT_EQ(identity->get_InstrumentManufacturer(maker.Out()), S_OK);
    EXPECT_EQ(maker.utf8(), "QUORLEN TECHNOLOGIES");
    EXPECT_EQ(driver->Close(), S_OK);
}

TEST_F(DriverActivation, AnUnregisteredDriverIsNotFound) {
    ASSERT_EQ(CallModule("DllUnregisterServer"), S_OK);
    CLSID clsid = GUID_NULL;
    EXPECT_EQ(CLSIDFromProgID(u"Quorlen731XX.Quorlen731XX", &clsid), CO_E_CLASSSTRING);
    ComPtr<IIviDriver> driver;
    EXPECT_EQ(CoCreateInstance(CLSID_Quorlen731XX, nullptr, CLSCTX_INPROC_SERVER,
                               iid_of<IIviDriver>, driver.OutVoid()),
              REGDB_E_CLASSNOTREG);
}

}  // namespace
