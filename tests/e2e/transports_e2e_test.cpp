// One end-to-end flow over every transport the emulator serves: identify,
// configure, capture and fetch a waveform, measure, with the status check on.
#include <gtest/gtest.h>

#include <cstdlib>
#include <optional>
#include <vector>

#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "emulator/emulator.h"
#include "emulator/serial_line.h"
#include "io/io_manager.h"
#include "tests/support/emulator_driver.h"

namespace qn::test {
namespace {

enum class Transport { kSocket, kVxi11, kHislip, kSerial };
constexpr const char* kTransportNames[] = {"Socket", "Vxi11", "Hislip", "Serial"};

class FlowOverTransport : public ::testing::TestWithParam<Transport> {
  protected:
    void SetUp() override {
        ::setenv("IVI_CONFIG_STORE", "/nonexistent/qn-store.xml", 1);
        emu_.EnableVxi11();
        emu_.EnableHislip();
        const std::uint16_t raw = emu_.Start();
        switch (GetParam()) {
            case Transport::kSocket:
                resource_ = SocketResource(raw);
                break;
            case Transport::kVxi11:
                resource_ = "TCPIP0::127.0.0.1:" + std::to_string(emu_.vxi11_port()) +
                            "::inst0::INSTR";
                break;
            case Transport::kHislip:
                resource_ = "TCPIP0::127.0.0.1::hislip0," + std::to_string(emu_.hislip_port()) +
                            "::INSTR";
                break;
            case Transport::kSerial:
                serial_.emplace(emu_);
                resource_ = "ASRL" + serial_->path() + "::INSTR";
                break;
        }
    }
    emu::Emulator emu_{"QDS4032A"};
    std::optional<emu::SerialLine> serial_;
    std::string resource_;
};

TEST_P(FlowOverTransport, IdentifyConfigureCaptureFetchMeasure) {
    ComPtr<Quorlen731XX> driver = com::MakeComObject<Quorlen731XX>();
    com::Bstr r(resource_), o("QueryInstrStatus=true");
    ASSERT_EQ(driver->Initialize(r.get(), VARIANT_TRUE, VARIANT_TRUE, o.get()), S_OK)
        << ErrorText();
    com::Bstr model;
    ASSERT_EQ(driver->get_InstrumentModel(model.Out()), S_OK);
    EXPECT_EQ(model.utf8(), "QDS4032A");

    IIviScopeAcquisition* acq = driver.get();
    ASSERT_EQ(acq->put_TimePerRecord(0.002), S_OK) << ErrorText();
    double tpr = 0;
    ASSERT_EQ(acq->get_TimePerRecord(&tpr), S_OK);
    EXPECT_DOUBLE_EQ(tpr, 0.002);

    ComPtr<IIviScopeMeasurement> ch1;
    com::Bstr name("Channel1");
    ASSERT_EQ(static_cast<IIviScopeMeasurements*>(driver.get())->get_Item(name.get(), ch1.Out()),
              S_OK);
    SAFEARRAY* a = nullptr;
    double x0 = 0, dx = 0;
    ASSERT_EQ(ch1->ReadWaveform(5000, &a, &x0, &dx), S_OK) << ErrorText();
    com::SafeArray wave(a);
    EXPECT_GT(wave.size(), 100u);
    EXPECT_GT(dx, 0.0);
    double vpp = 0;
    ASSERT_EQ(ch1->FetchWaveformMeasurement(IviScopeMeasurementVoltagePeakToPeak, &vpp), S_OK)
        << ErrorText();
    EXPECT_GT(vpp, 0.0);

    std::string idn;
    EXPECT_EQ(qn::Io(*driver.get()).InstrQuery("*IDN?", &idn, 256), S_OK);
    EXPECT_EQ(idn.rfind("QUORLEN TECHNOLOGIES,QDS4032A,", 0), 0u) << idn;
    EXPECT_EQ(driver->Close(), S_OK);
}

INSTANTIATE_TEST_SUITE_P(Transports, FlowOverTransport,
                         ::testing::Values(Transport::kSocket, Transport::kVxi11,
                                           Transport::kHislip, Transport::kSerial),
                         [](const auto& p) { return kTransportNames[int(p.param)]; });

}  // namespace
}  // namespace qn::test
