// The instrument's IEEE 488.2 status system (IQuorlen731XXStatus on the root
// object): preset and clear, service-request masks, register access and the
// serial poll.
#include <array>
#include <string>

#include "Quorlen731XXErrors.h"
#include "core/member_impl.h"
#include "core/root.h"

namespace qn {

#define QN_CLASS Quorlen731XX
#include "core/member_definitions_begin.h"
#include "members/IQuorlen731XXStatus.def"
#include "QnEndMembers.h"
#undef QN_CLASS

namespace {

// The mask bits one service-request reason sets in each of the four enable
// registers (*SRE, *ESE, :OPEE, :OVL).
struct ReasonMasks {
    LONG reason;
    std::string_view name;
    LONG sre, ese, opee, ovl;
};

constexpr ReasonMasks kReasons[] = {
    {Quorlen731XXSRQReasonStbMAV, "Quorlen731XXSRQReasonStbMAV", 16, 0, 0, 0},
    {Quorlen731XXSRQReasonStbMSG, "Quorlen731XXSRQReasonStbMSG", 4, 0, 0, 0},
    {Quorlen731XXSRQReasonEsrOPC, "Quorlen731XXSRQReasonEsrOPC", 32, 1, 0, 0},
    {Quorlen731XXSRQReasonEsrQueryError, "Quorlen731XXSRQReasonEsrQueryError", 32, 4, 0, 0},
    {Quorlen731XXSRQReasonEsrDeviceError, "Quorlen731XXSRQReasonEsrDeviceError", 32, 8, 0, 0},
    {Quorlen731XXSRQReasonEsrExecutionError, "Quorlen731XXSRQReasonEsrExecutionError", 32, 16, 0,
     0},
    {Quorlen731XXSRQReasonEsrCommandError, "Quorlen731XXSRQReasonEsrCommandError", 32, 32, 0, 0},
    {Quorlen731XXSRQReasonEsrUserRequest, "Quorlen731XXSRQReasonEsrUserRequest", 32, 64, 0, 0},
    {Quorlen731XXSRQReasonEsrPowerOn, "Quorlen731XXSRQReasonEsrPowerOn", 32, 128, 0, 0},
    {Quorlen731XXSRQReasonStbUSR, "Quorlen731XXSRQReasonStbUSR", 2, 0, 0, 0},
    {Quorlen731XXSRQReasonStbTRG, "Quorlen731XXSRQReasonStbTRG", 1, 0, 0, 0},
    {Quorlen731XXSRQReasonOperRunning, "Quorlen731XXSRQReasonOperRunning", 128, 0, 8, 0},
    {Quorlen731XXSRQReasonOperWaitTrig, "Quorlen731XXSRQReasonOperWaitTrig", 128, 0, 32, 0},
    {Quorlen731XXSRQReasonOverloadChan1, "Quorlen731XXSRQReasonOverloadChan1", 128, 0, 2048, 1},
    {Quorlen731XXSRQReasonOverloadChan2, "Quorlen731XXSRQReasonOverloadChan2", 128, 0, 2048, 2},
    {Quorlen731XXSRQReasonOverloadChan3, "Quorlen731XXSRQReasonOverloadChan3", 128, 0, 2048, 4},
    {Quorlen731XXSRQReasonOverloadChan4, "Quorlen731XXSRQReasonOverloadChan4", 128, 0, 2048, 8},
    {Quorlen731XXSRQReasonOverloadExternal, "Quorlen731XXSRQReasonOverloadExternal", 128, 0,
     2048, 16},
    // The fault reasons are accepted and program nothing.
};
constexpr LONG kAllReasons = 0x1FFFFFF;

// Reply used for a sub-register that reads as a constant without I/O.
constexpr std::string_view kConstantOne = "1";

// How each register is read and written. An empty query is a rejected
// sub-register; an empty mask name a register whose enable cannot be written.
struct RegisterAccess {
    std::string_view condition, early_condition;
    std::string_view event, early_event;
    std::string_view enable;
    std::string_view mask;
    LONG mask_bits;
    bool needs_protection;  // the overload register exists only with channel protection
};

constexpr std::array<RegisterAccess, 6> kRegisters = {{
    {"", "", "*STB?", "*STB?", "*SRE?", "*SRE", 255, false},
    {"", "", "*ESR?", "*ESR?", "*ESE?", "*ESE", 255, false},
    {"OPER:COND?", "OPER?", ":OPER:EVEN?", "", ":OPEE?", ":OPEE", 65535, false},
    {"", "", ":OVLR?", ":OVLR?", "OVL?", ":OVL", 4095, true},
    {"", "", ":TER?", ":TER?", kConstantOne, "", 0, false},
    {"", "", ":AER?", ":AER?", kConstantOne, "", 0, false},
}};

constexpr std::array<std::string_view, 3> kSubRegisterNames = {
    "Quorlen731XXStatusSubRegisterCondition", "Quorlen731XXStatusSubRegisterEvent",
    "Quorlen731XXStatusSubRegisterEnable"};

std::string_view ReadCommand(const RegisterAccess& r, LONG sub, bool early) {
    switch (sub) {
        case Quorlen731XXStatusSubRegisterCondition: return early ? r.early_condition : r.condition;
        case Quorlen731XXStatusSubRegisterEvent: return early ? r.early_event : r.event;
        default: return r.enable;
    }
}

std::string SimulationKey(LONG reg, LONG sub) {
    return "IQuorlen731XXStatus.Register." + std::to_string(reg) + "." + std::to_string(sub);
}

// Checks both indexes; S_OK when they name a register and a sub-register.
HRESULT CheckRegisterArgs(CErrorManagerBase& errors, std::string_view method, LONG reg, LONG sub) {
    if (sub < 0 || sub >= static_cast<LONG>(kSubRegisterNames.size()))
        return errors.InvalidValue("ReturnInvalidSubRegister", "eSubRegister",
                                   "Unknown Quorlen731XXStatusSubRegisterEnum");
    if (reg < 0 || reg >= static_cast<LONG>(kRegisters.size()))
        return errors.InvalidValue(method, "Register", std::int32_t{reg});
    return S_OK;
}

}  // namespace

HRESULT Quorlen731XX::IQuorlen731XXStatus_Preset_Body() {
    if (Core().Simulating()) return S_OK;
    return Io(*this).InstrWrite(Core().features.channel_protection ? "*CLS;:OPEE 31;:OVL 0"
                                                                   : "*CLS;:OPEE 31");
}

HRESULT Quorlen731XX::IQuorlen731XXStatus_Clear_Body() {
    if (Core().Simulating()) return S_OK;
    return Io(*this).InstrPrintCommand();
}

HRESULT Quorlen731XX::IQuorlen731XXStatus_ConfigureServiceRequest_Body(
    Quorlen731XXSRQReasonEnum Reason) {
    const LONG reason = Reason;
    if (reason < 0 || reason > kAllReasons)
        return Errors().InvalidValue("ConfigureServiceRequest", "Reason", std::int32_t{reason});
    if (Core().Simulating()) return S_OK;
    const bool protection = Core().features.channel_protection;
    LONG sre = 0, ese = 0, opee = 0, ovl = 0;
    for (const ReasonMasks& r : kReasons) {
        if ((reason & r.reason) == 0) continue;
        if (r.ovl != 0 && !protection)
            return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED, {r.name});
        sre |= r.sre;
        ese |= r.ese;
        opee |= r.opee;
        ovl |= r.ovl;
    }
    using I = std::int64_t;
    if (protection)
        return Io(*this).InstrPrintf("*CLS; *SRE %d; *ESE %d; :OPEE %d; :OVL %d", I{sre}, I{ese},
                                     I{opee}, I{ovl});
    return Io(*this).InstrPrintf("*CLS; *SRE %d; *ESE %d; :OPEE %d", I{sre}, I{ese}, I{opee});
}

HRESULT Quorlen731XX::IQuorlen731XXStatus_get_Register_Body(
    Quorlen731XXStatusRegisterEnum Register, Quorlen731XXStatusSubRegisterEnum SubRegister,
    LONG* pVal) {
    if (HRESULT hr = CheckRegisterArgs(Errors(), "get_Register", Register, SubRegister); FAILED(hr))
        return hr;
    if (Core().Simulating()) {
        if (auto* e = Cache().FindCacheEntry<LONG>(SimulationKey(Register, SubRegister)))
            e->Get(pVal);
        return S_OK;
    }
    const RegisterAccess& r = kRegisters[static_cast<std::size_t>(Register)];
    const std::string_view command = ReadCommand(r, SubRegister, Core().features.early_family);
    if (command.empty())
        return Errors().InvalidValue("get_Register", "SubRegister",
                                     kSubRegisterNames[static_cast<std::size_t>(SubRegister)]);
    if (command == kConstantOne) {
        *pVal = 1;
        return S_OK;
    }
    *pVal = -1;
    LONG value = 0;
    HRESULT hr = Io(*this).InstrQuery(command, &value);
    if (SUCCEEDED(hr)) *pVal = value;
    return hr;
}

HRESULT Quorlen731XX::IQuorlen731XXStatus_put_Register_Body(
    Quorlen731XXStatusRegisterEnum Register, Quorlen731XXStatusSubRegisterEnum SubRegister,
    LONG val) {
    if (HRESULT hr = CheckRegisterArgs(Errors(), "put_Register", Register, SubRegister); FAILED(hr))
        return hr;
    if (SubRegister != Quorlen731XXStatusSubRegisterEnable)
        return Errors().InvalidValue("put_Register", "SubRegister",
                                     kSubRegisterNames[static_cast<std::size_t>(SubRegister)]);
    const RegisterAccess& r = kRegisters[static_cast<std::size_t>(Register)];
    if (r.mask.empty()) return Errors().InvalidValue("put_Register", "Register", std::int32_t{Register});
    if (Core().Simulating()) {
        if (auto* e = Cache().GetCacheEntry<LONG>(SimulationKey(Register, SubRegister))) e->Set(val);
        return S_OK;
    }
    if (r.needs_protection && !Core().features.channel_protection)
        return Errors().Error(Msg::E_QUORLEN731XX_MODEL_NOT_SUPPORTED,
                              {"Quorlen731XXStatusRegisterOverloadEvent"});
    return Io(*this).InstrPrintf("%s %d", r.mask, std::int64_t{val & r.mask_bits});
}

HRESULT Quorlen731XX::IQuorlen731XXStatus_get_SerialPoll_Body(LONG* val) {
    SHORT stb = 0;
    HRESULT hr = Io(*this).ReadSTB(&stb);
    if (FAILED(hr)) return Core().io->ReportIOError(Errors(), hr);
    *val = stb;
    return S_OK;
}

}  // namespace qn
