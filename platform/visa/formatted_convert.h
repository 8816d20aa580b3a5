// Conversions of the formatted-I/O object: element types and sizes, values
// between text, doubles and VARIANTs, and the byte order of block data.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "platform/com/variant.h"
#include "platform/visa/visa.h"

namespace qn::visa::fmt {

// VARTYPE of the elements of an ASCII or binary type code, VT_EMPTY when the
// code is not one of them (Any gives VT_VARIANT).
VARTYPE AsciiElementType(LONG type);
VARTYPE BinaryElementType(LONG type);
// The same, reporting an unknown code (E_INVALIDARG, with the code in the
// thread's error information).
HRESULT AsciiTypeOrError(LONG type, VARTYPE* vt);
HRESULT BinaryTypeOrError(LONG type, VARTYPE* vt);
// Bytes of one element of a plain (non-BSTR, non-VARIANT) VARTYPE, 0 otherwise.
std::size_t PlainElementSize(VARTYPE vt);

// Stores a parsed reply field into *out (cleared first) as element type vt:
// integers truncated toward zero and range-checked, R4 rounded, BSTR the
// text itself, VARIANT (Any) a double when the text is a number, else the
// text. Fails with DISP_E_OVERFLOW, E_VISA_INVALID_FORMAT or E_OUTOFMEMORY
// and a description in *error.
HRESULT FieldToVariant(std::string_view text, VARTYPE vt, VARIANT* out, std::string* error);

// Writes element i of a plain array (or any VARIANT element) into dst of
// element type vt. Used by ReadList to fill its result array.
HRESULT StoreElement(const VARIANT& value, VARTYPE vt, void* dst);

// Text of one value for WriteNumber/WriteList: integers "%d" style, R4
// "%.7g", R8 "%.15g", BSTR as is; Any formats by the value's own type.
HRESULT FormatValue(const VARIANT& value, VARTYPE vt, std::string* out, std::string* error);

// Reverses the bytes of every element of size elem (2, 4 or 8) in place.
void SwapBytes(void* data, std::size_t bytes, std::size_t elem);

// True when block data in the instrument's order (big_endian) must be
// swapped for this machine.
bool NeedsSwap(bool instrument_big_endian);

}  // namespace qn::visa::fmt
