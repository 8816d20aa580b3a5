// The VXI-11 (TCP/IP instrument protocol) numbers shared by the client
// transport and the emulator's server: RPC programs and procedures, operation
// flags, read-end reasons and device error codes.
#pragma once

#include <cstdint>

namespace qn::vxi11 {

inline constexpr std::uint32_t kCoreProgram = 0x0607AF;
inline constexpr std::uint32_t kAbortProgram = 0x0607B0;
inline constexpr std::uint32_t kVersion = 1;

enum Procedure : std::uint32_t {
    kDeviceAbort = 1,  // abort channel
    kCreateLink = 10,
    kDeviceWrite = 11,
    kDeviceRead = 12,
    kDeviceReadStb = 13,
    kDeviceTrigger = 14,
    kDeviceClear = 15,
    kDeviceRemote = 16,
    kDeviceLocal = 17,
    kDeviceLock = 18,
    kDeviceUnlock = 19,
    kDestroyLink = 23,
};

// Operation flags.
inline constexpr std::uint32_t kFlagWaitLock = 1;
inline constexpr std::uint32_t kFlagEnd = 8;
inline constexpr std::uint32_t kFlagTermCharSet = 128;

// Why a device_read ended (bits).
inline constexpr std::uint32_t kReasonRequestCount = 1;
inline constexpr std::uint32_t kReasonTermChar = 2;
inline constexpr std::uint32_t kReasonEnd = 4;

enum DeviceError : std::int32_t {
    kNoError = 0,
    kSyntaxError = 1,
    kNotAccessible = 3,
    kInvalidLinkId = 4,
    kParameterError = 5,
    kNotSupported = 8,
    kOutOfResources = 9,
    kLockedByAnother = 11,
    kNoLockHeld = 12,
    kIoTimeout = 15,
    kIoError = 17,
    kAbort = 23,
};

}  // namespace qn::vxi11
