// termios settings of a serial line (serial_transport.cpp).
#pragma once

#include <termios.h>

#include <string>

#include "platform/visa/transport.h"

namespace qn::visa {

// Sets *t to a raw line with the speed, character format and flow control
// of s. A value the line cannot take: E_VISA_ATTRIBUTE_STATE (1.5 stop bits
// and DTR/DSR flow control: E_VISA_NOT_SUPPORTED) with *error, *t unchanged.
HRESULT SerialTermios(const SerialSettings& s, termios* t, std::string* error);

}  // namespace qn::visa
