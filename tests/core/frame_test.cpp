#include "tests/core/driver_fixture.h"

namespace qn::test {
namespace {

TEST_F(DriverTest, SessionMembersNeedAnInitializedSession) {
    VARIANT_BOOL b = VARIANT_TRUE;
    EXPECT_EQ(driver_->get_Cache(&b), E_IVI_NOT_INITIALIZED);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: A connection to the instrument has not been established.");
    com::Bstr s;
    EXPECT_EQ(driver_->get_Description(s.Out()), S_OK);
    EXPECT_EQ(s.utf8(),
              "IVI Driver for Quorlen 731XX, 7312X, 3XXX, 2XXX and 4XXX family of Oscilloscopes");
    EXPECT_EQ(driver_->get_Initialized(&b), S_OK);
    EXPECT_EQ(b, VARIANT_FALSE);
    IIviDriverUtility* util = nullptr;
    EXPECT_EQ(driver_->get_Utility(&util), S_OK);
    ASSERT_NE(util, nullptr);
    util->Release();
}

TEST_F(DriverTest, NullOutPointerNamesEntryAndParameter) {
    ASSERT_EQ(Init("", "Simulate=true"), S_OK);
    EXPECT_EQ(driver_->get_Initialized(nullptr), E_IVI_NULL_POINTER);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Null pointer passed for method get_Initialized, parameter "
              "pbInitialized.");
    LONG code = 0;
    EXPECT_EQ(driver_->ErrorQuery(&code, nullptr), E_IVI_NULL_POINTER);
    EXPECT_EQ(ErrorText(),
              "Quorlen731XX: Null pointer passed for method ErrorQuery, parameter ErrorMessage.");
    EXPECT_EQ(driver_->CallContexts().Depth(), 0u);
}

TEST_F(DriverTest, ErrorInformationCarriesTheCalledInterfaceAndOnlyForTheFailingCall) {
    ASSERT_EQ(Init("", "Simulate=true"), S_OK);
    EXPECT_EQ(driver_->LockObject(), E_IVI_METHOD_NOT_SUPPORTED);
    com::ErrorRecord rec;
    ASSERT_TRUE(com::TakeThreadError(&rec));
    EXPECT_EQ(rec.guid, iid_of<IIviDriverUtility>);
    EXPECT_EQ(rec.source, "Quorlen731XX.Quorlen731XX.1");
    // The error context is restored after each call.
    EXPECT_EQ(driver_->Errors().ErrorIid(), GUID_NULL);
    driver_->LockObject();
    VARIANT_BOOL b = 0;
    EXPECT_EQ(driver_->get_Cache(&b), S_OK);
    EXPECT_FALSE(HasErrorInfo());
}

TEST_F(DriverTest, CacheOffInvalidatesStoredValues) {
    ASSERT_EQ(Init("", "Simulate=true"), S_OK);
    auto* e = driver_->Cache().GetCacheEntry<double>("IQuorlen731XXTest.Value");
    e->Set(2.5);
    EXPECT_EQ(driver_->put_Cache(VARIANT_FALSE), S_OK);
    EXPECT_FALSE(e->IsValid());
}

TEST_F(DriverTest, InterfacesAreReachableByQueryInterface) {
    ComPtr<IIviComponentIdentity> comp;
    ASSERT_EQ(ComPtr<IIviDriver>(driver_.get()).As(comp), S_OK);
    com::Bstr s;
    EXPECT_EQ(comp->get_Vendor(s.Out()), S_OK);
    EXPECT_EQ(s.utf8(), "Quorlen Technologies");
    EXPECT_EQ(driver_->InterfaceSupportsErrorInfo(iid_of<IIviDriverOperation>), S_OK);
    EXPECT_EQ(driver_->InterfaceSupportsErrorInfo(iid_of<IClassFactory>), S_FALSE);
}

}  // namespace
}  // namespace qn::test
