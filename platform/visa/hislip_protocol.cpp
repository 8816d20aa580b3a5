#include "platform/visa/hislip_protocol.h"

namespace qn::hislip {
namespace {

constexpr std::string_view kTypeNames[] = {
    "Initialize",
    "InitializeResponse",
    "FatalError",
    "Error",
    "AsyncLock",
    "AsyncLockResponse",
    "Data",
    "DataEnd",
    "DeviceClearComplete",
    "DeviceClearAcknowledge",
    "AsyncRemoteLocalControl",
    "AsyncRemoteLocalResponse",
    "Trigger",
    "Interrupted",
    "AsyncInterrupted",
    "AsyncMaximumMessageSize",
    "AsyncMaximumMessageSizeResponse",
    "AsyncInitialize",
    "AsyncInitializeResponse",
    "AsyncDeviceClear",
    "AsyncServiceRequest",
    "AsyncStatusQuery",
    "AsyncStatusResponse",
    "AsyncDeviceClearAcknowledge",
    "AsyncLockInfo",
    "AsyncLockInfoResponse",
};

constexpr const char* kErrorTexts[] = {
    "unidentified error",        "unrecognized message type",
    "unrecognized control code", "unrecognized vendor defined message",
    "message too large",
};

constexpr const char* kFatalTexts[] = {
    "unidentified error",
    "poorly formed message header",
    "connection used without both channels established",
    "invalid initialization sequence",
    "maximum number of clients exceeded",
};

void PutBig(std::uint64_t v, int bytes, std::uint8_t* out) {
    for (int i = bytes - 1; i >= 0; --i, v >>= 8) out[i] = std::uint8_t(v & 0xff);
}

std::uint64_t GetBig(const std::uint8_t* in, int bytes) {
    std::uint64_t v = 0;
    for (int i = 0; i < bytes; ++i) v = (v << 8) | in[i];
    return v;
}

}  // namespace

void EncodeHeader(const Header& h, std::uint8_t out[kHeaderSize]) {
    out[0] = 'H';
    out[1] = 'S';
    out[2] = h.type;
    out[3] = h.control;
    PutBig(h.parameter, 4, out + 4);
    PutBig(h.length, 8, out + 8);
}

std::string EncodeMessage(std::uint8_t type, std::uint8_t control, std::uint32_t parameter,
                          std::string_view payload) {
    std::string m(kHeaderSize + payload.size(), '\0');
    EncodeHeader({type, control, parameter, payload.size()},
                 reinterpret_cast<std::uint8_t*>(m.data()));
    m.replace(kHeaderSize, payload.size(), payload);
    return m;
}

bool DecodeHeader(const std::uint8_t in[kHeaderSize], Header* h) {
    if (in[0] != 'H' || in[1] != 'S') return false;
    h->type = in[2];
    h->control = in[3];
    h->parameter = std::uint32_t(GetBig(in + 4, 4));
    h->length = GetBig(in + 8, 8);
    return true;
}

std::string EncodeSize(std::uint64_t size) {
    std::string s(8, '\0');
    PutBig(size, 8, reinterpret_cast<std::uint8_t*>(s.data()));
    return s;
}

bool DecodeSize(std::string_view payload, std::uint64_t* size) {
    if (payload.size() != 8) return false;
    *size = GetBig(reinterpret_cast<const std::uint8_t*>(payload.data()), 8);
    return true;
}

std::string MessageTypeName(std::uint8_t type) {
    if (type < std::size(kTypeNames)) return std::string(kTypeNames[type]);
    return "type " + std::to_string(type);
}

const char* ErrorCodeText(std::uint8_t code) {
    return code < std::size(kErrorTexts) ? kErrorTexts[code] : "error";
}

const char* FatalCodeText(std::uint8_t code) {
    return code < std::size(kFatalTexts) ? kFatalTexts[code] : "fatal error";
}

}  // namespace qn::hislip
