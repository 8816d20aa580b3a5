// The instrument setup and the screen image through IQuorlen731XXSystem:
// setups in the instrument's numbered memories, the whole setup as an
// IEEE 488.2 block both ways, and the screen as a bitmap block.
#include "Quorlen731XXErrors.h"
#include "core/root.h"
#include "io/io_manager.h"
#include "platform/visa/visa.h"
#include "scope/waveform_transfer.h"

namespace qn {

namespace {

#include "scope/row_commands_begin.h"
#include "members/IQuorlen731XXSystem.def"
#include "QnEndMembers.h"

// While simulating, the block queries deliver an empty array of bytes.
HRESULT EmptyBytes(SAFEARRAY** out) {
    com::SafeArray empty = com::SafeArray::Vector(VT_UI1, 0);
    if (!empty) throw std::bad_alloc();
    *out = empty.Detach();
    return S_OK;
}

HRESULT QueryBytes(Quorlen731XX& root, std::string_view command, SAFEARRAY** out) {
    if (root.Core().Simulating()) return EmptyBytes(out);
    com::SafeArray block;
    HRESULT hr = QueryBinaryBlock(root, command, visa::BinaryType_UI1, &block);
    if (SUCCEEDED(hr)) *out = block.Detach();
    return hr;
}

}  // namespace

// The bytes are checked before anything is sent: a one-dimensional array of
// bytes no longer than the largest block the session accepts.
HRESULT Quorlen731XX::IQuorlen731XXSystem_PutState_Body(SAFEARRAY* Data) {
    if (!Data) return Errors().NullPointer("PutState", "Data");
    VARTYPE vt = VT_EMPTY;
    if (FAILED(SafeArrayGetVartype(Data, &vt)) || vt != VT_UI1 || SafeArrayGetDim(Data) != 1)
        return Errors().InvalidValue("PutState", "Data", "not a one-dimensional array of bytes");
    if (LONGLONG(com::SafeArrayCount(Data)) > visa::kDefaultMaxBlockBytes)
        return Errors().InvalidValue("PutState", "Data", "longer than the largest setup block");
    if (Core().Simulating()) return S_OK;
    CDriverIOManager io(*this);
    VARIANT data{};
    data.vt = VT_ARRAY | VT_UI1;
    data.parray = Data;  // borrowed for the write, not owned
    HRESULT hr = io.FormattedWriteIEEEBlock(IQuorlen731XXSystem_PutState_Command, data, false);
    if (SUCCEEDED(hr)) hr = io.FormattedWriteString("\n", true);
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXSystem_GetState_Body(SAFEARRAY** pVal) {
    return QueryBytes(*this, IQuorlen731XXSystem_GetState_Command, pVal);
}

HRESULT Quorlen731XX::IQuorlen731XXSystem_GetScreenBitmap_Body(SAFEARRAY** pVal) {
    return QueryBytes(*this, IQuorlen731XXSystem_GetScreenBitmap_Command, pVal);
}

}  // namespace qn
