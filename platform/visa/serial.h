// The line settings of a serial session (ASRL resources).
#pragma once

#include "platform/visa/visa.h"

namespace qn::visa {

// ISerial::put_Parity values.
enum SerialParity : SHORT {
    kParityNone = 0,
    kParityOdd = 1,
    kParityEven = 2,
    kParityMark = 3,
    kParitySpace = 4,
};

// ISerial::put_FlowControl values (one at a time).
enum SerialFlowControl : SHORT {
    kFlowNone = 0,
    kFlowXonXoff = 1,
    kFlowRtsCts = 2,
};

// ISerial stop bits, in tenths of a bit.
enum SerialStopBits : SHORT { kStopOne = 10, kStopTwo = 20 };

}  // namespace qn::visa

// Offered by serial sessions only (QueryInterface fails for others). A new
// session runs at 9600 baud, 8 data bits, no parity, one stop bit, no flow
// control. A put applies the setting to the port at once; a value the port
// cannot take is refused with E_VISA_ATTRIBUTE_STATE (E_VISA_NOT_SUPPORTED
// for 1.5 stop bits and DTR/DSR flow control, which the Linux serial driver
// lacks) and changes nothing. Replies end at the session's termination
// character (IMessage).
struct ISerial : IUnknown {
    QN_INTERFACE_ID("5b0c6a31-8d0e-4f7a-9c1e-3a6f2d8b7c08");
    virtual HRESULT get_BaudRate(LONG* pVal) = 0;
    virtual HRESULT put_BaudRate(LONG val) = 0;
    virtual HRESULT get_DataBits(SHORT* pVal) = 0;  // 5 to 8
    virtual HRESULT put_DataBits(SHORT val) = 0;
    virtual HRESULT get_Parity(SHORT* pVal) = 0;  // SerialParity
    virtual HRESULT put_Parity(SHORT val) = 0;
    virtual HRESULT get_StopBits(SHORT* pVal) = 0;  // SerialStopBits
    virtual HRESULT put_StopBits(SHORT val) = 0;
    virtual HRESULT get_FlowControl(SHORT* pVal) = 0;  // SerialFlowControl
    virtual HRESULT put_FlowControl(SHORT val) = 0;
};
