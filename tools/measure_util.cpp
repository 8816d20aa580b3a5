#include "tools/measure_util.h"

namespace qn::tools {

HRESULT MeasurementNamed(Quorlen731XX* driver, const std::string& name,
                         ComPtr<IQuorlen731XXMeasurement>* m) {
    com::Bstr item(name);
    return static_cast<IQuorlen731XXMeasurements*>(driver)->get_Item(item.get(), m->Out());
}

HRESULT ShowChannel(ToolSession& session, long channel, ComPtr<IQuorlen731XXMeasurement>* m) {
    Quorlen731XX* driver = session.driver.get();
    const std::string n = std::to_string(channel);
    if (session.emulator) {
        ComPtr<IQuorlen731XXChannel> ch;
        com::Bstr item("UserChannel" + n);
        HRESULT hr = static_cast<IQuorlen731XXChannels*>(driver)->get_Item(item.get(), ch.Out());
        if (SUCCEEDED(hr)) hr = ch->put_Enabled(VARIANT_TRUE);
        if (FAILED(hr)) return hr;
    }
    return MeasurementNamed(driver, "UserChannel" + n, m);
}

}  // namespace qn::tools
