// The HiSLIP (high-speed LAN instrument protocol) message codec shared by the
// client transport and the emulator's server. Every message is a 16-byte
// header followed by its payload:
//
//   offset 0  "HS"              prologue
//   offset 2  message type      1 byte
//   offset 3  control code      1 byte
//   offset 4  message parameter 4 bytes, big-endian
//   offset 8  payload length    8 bytes, big-endian
//
// Pure functions and small value types, no I/O. The payload length is only
// decoded here; every reader checks it against its own bound before reading.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace qn::hislip {

inline constexpr std::size_t kHeaderSize = 16;
inline constexpr std::uint16_t kDefaultPort = 4880;
// Protocol version 1.0 in the upper half of the Initialize parameters.
inline constexpr std::uint16_t kProtocolVersion = 0x0100;
// Message ids of the client start here after Initialize and after a device
// clear, and grow by 2 with every Data, DataEnd or Trigger message.
inline constexpr std::uint32_t kFirstMessageId = 0xFFFFFF00u;
inline constexpr std::uint32_t kMessageIdStep = 2;
// Control code bit of Data, DataEnd, Trigger and AsyncStatusQuery: the client
// has read a whole reply (DataEnd) since its last message.
inline constexpr std::uint8_t kRmtDelivered = 0x01;
// Control code bit of InitializeResponse: the server works in overlapped mode.
inline constexpr std::uint8_t kOverlapMode = 0x01;

enum MessageType : std::uint8_t {
    kInitialize = 0,
    kInitializeResponse = 1,
    kFatalError = 2,
    kError = 3,
    kAsyncLock = 4,
    kAsyncLockResponse = 5,
    kData = 6,
    kDataEnd = 7,
    kDeviceClearComplete = 8,
    kDeviceClearAcknowledge = 9,
    kAsyncRemoteLocalControl = 10,
    kAsyncRemoteLocalResponse = 11,
    kTrigger = 12,
    kInterrupted = 13,
    kAsyncInterrupted = 14,
    kAsyncMaximumMessageSize = 15,
    kAsyncMaximumMessageSizeResponse = 16,
    kAsyncInitialize = 17,
    kAsyncInitializeResponse = 18,
    kAsyncDeviceClear = 19,
    kAsyncServiceRequest = 20,
    kAsyncStatusQuery = 21,
    kAsyncStatusResponse = 22,
    kAsyncDeviceClearAcknowledge = 23,
    kAsyncLockInfo = 24,
    kAsyncLockInfoResponse = 25,
};

// Control codes of AsyncLock (request or release) and AsyncLockResponse.
enum LockCode : std::uint8_t {
    kLockRelease = 0,
    kLockRequest = 1,
    kLockFailure = 0,        // response: not granted in time
    kLockSuccess = 1,        // response: granted, or released
    kLockSuccessShared = 2,  // response: a shared lock granted or released
    kLockError = 3,          // response: a release without a lock, or a bad request
};

// Control codes of Error (non-fatal: the connection stays up).
enum ErrorCode : std::uint8_t {
    kErrorUnidentified = 0,
    kErrorUnrecognizedMessageType = 1,
    kErrorUnrecognizedControlCode = 2,
    kErrorUnrecognizedVendorMessage = 3,
    kErrorMessageTooLarge = 4,
};

// Control codes of FatalError (the sender closes both channels after it).
enum FatalCode : std::uint8_t {
    kFatalUnidentified = 0,
    kFatalBadHeader = 1,
    kFatalChannelsNotReady = 2,
    kFatalBadInitialization = 3,
    kFatalTooManyClients = 4,
};

struct Header {
    std::uint8_t type = 0;
    std::uint8_t control = 0;
    std::uint32_t parameter = 0;
    std::uint64_t length = 0;  // payload bytes that follow the header
};

void EncodeHeader(const Header& h, std::uint8_t out[kHeaderSize]);
// The header followed by the payload (its length is the payload's size).
std::string EncodeMessage(std::uint8_t type, std::uint8_t control, std::uint32_t parameter,
                          std::string_view payload = {});
// False when the first two bytes are not "HS"; *h is then left unchanged.
bool DecodeHeader(const std::uint8_t in[kHeaderSize], Header* h);

// The 8-byte big-endian payload of AsyncMaximumMessageSize and its response.
std::string EncodeSize(std::uint64_t size);
// False unless payload is exactly 8 bytes.
bool DecodeSize(std::string_view payload, std::uint64_t* size);

// "DataEnd", "AsyncStatusQuery", ...; "type N" for unknown types.
std::string MessageTypeName(std::uint8_t type);
const char* ErrorCodeText(std::uint8_t code);
const char* FatalCodeText(std::uint8_t code);

}  // namespace qn::hislip
