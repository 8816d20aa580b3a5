// The VISA-COM substitute: resource manager, instrument sessions (IVisaSession,
// IMessage, IRegister), the IEEE 488.2 formatted-I/O object (IFormattedIO488)
// and two extension interfaces (IMessageDirect, IFormattedIO488Direct) that
// move data straight between the transport and the caller's memory.
//
// The member shapes follow the published VISA-COM binding: every member
// returns an HRESULT, strings are BSTRs, byte arrays are one-dimensional
// SAFEARRAYs of VT_UI1 with lower bound 0, booleans are VARIANT_BOOL.
//
// Failures return one of the E_VISA_* codes below (or a standard COM code for
// a bad argument) and leave a readable description in the calling thread's
// error information (qn::com::TakeThreadError / GetErrorInfo).
//
// Timeouts are milliseconds. kTimeoutInfinite (-1, the unsigned 0xFFFFFFFF)
// waits without limit; 0 means "do not wait": an operation succeeds only with
// what can be done at once. Other negative values are refused. A session
// timeout bounds a whole operation (all the chunks of one read or write), not
// each chunk.
#pragma once

#include <cstddef>

#include "platform/com/bstr.h"
#include "platform/com/safearray.h"
#include "platform/com/unknown.h"
#include "platform/com/variant.h"

namespace qn::visa {

// VISA-COM failures: facility ITF (0x8004) with the low word of the VISA
// status code they stand for.
constexpr HRESULT E_VISA_INVALID_OBJECT = HRESULT_FROM_BITS(0x8004000E);  // session closed
constexpr HRESULT E_VISA_RSRC_LOCKED = HRESULT_FROM_BITS(0x8004000F);  // locked by another session
constexpr HRESULT E_VISA_RESOURCE_NOT_FOUND = HRESULT_FROM_BITS(0x80040011);
constexpr HRESULT E_VISA_INVALID_RESOURCE_NAME = HRESULT_FROM_BITS(0x80040012);
constexpr HRESULT E_VISA_TIMEOUT = HRESULT_FROM_BITS(0x80040015);
constexpr HRESULT E_VISA_ATTRIBUTE_STATE = HRESULT_FROM_BITS(0x8004001D);  // value refused
constexpr HRESULT E_VISA_INVALID_LOCK_TYPE = HRESULT_FROM_BITS(0x80040020);
constexpr HRESULT E_VISA_INVALID_FORMAT = HRESULT_FROM_BITS(0x8004002C);   // unreadable reply
constexpr HRESULT E_VISA_IO = HRESULT_FROM_BITS(0x8004003E);
constexpr HRESULT E_VISA_NOT_SUPPORTED = HRESULT_FROM_BITS(0x80040067);
constexpr HRESULT E_VISA_USER_BUFFER = HRESULT_FROM_BITS(0x80040071);  // caller buffer too small
constexpr HRESULT E_VISA_ABORT = HRESULT_FROM_BITS(0x80040072);  // operation aborted
constexpr HRESULT E_VISA_INVALID_PROTOCOL = HRESULT_FROM_BITS(0x80040079);
constexpr HRESULT E_VISA_SESSION_NOT_LOCKED = HRESULT_FROM_BITS(0x8004009C);
constexpr HRESULT E_VISA_CONNECTION_LOST = HRESULT_FROM_BITS(0x800400A6);

// Session timeout values (milliseconds).
constexpr LONG kTimeoutInfinite = -1;  // VISA's 0xFFFFFFFF
constexpr LONG kTimeoutImmediate = 0;
constexpr LONG kDefaultTimeoutMs = 2000;
constexpr LONG kDefaultOpenTimeoutMs = 2000;

// IVisaSession::get_HardwareInterfaceType values.
enum HardwareInterfaceType : SHORT {
    kInterfaceGpib = 1,
    kInterfaceVxi = 2,
    kInterfaceGpibVxi = 3,
    kInterfaceAsrl = 4,
    kInterfacePxi = 5,
    kInterfaceTcpip = 6,
    kInterfaceUsb = 7,
};

// IResourceManager::Open access modes and IVisaSession lock types. An
// exclusive lock is the device's own (VXI-11 device_lock, HiSLIP AsyncLock):
// it holds against every other link to the instrument, from this process or
// any other. Shared locks are not offered (E_VISA_NOT_SUPPORTED); neither
// are locks on buses without a lock protocol (sockets, serial lines, USB).
enum AccessMode : LONG { kNoLock = 0, kExclusiveLock = 1, kSharedLock = 2, kLoadConfig = 4 };

// IMessage::AssertTrigger protocols: only the bus's default trigger.
enum TriggerProtocol : SHORT { kTriggerProtocolDefault = 0 };

// Element types of the ASCII formatted operations.
enum IEEEASCIIType : LONG {
    ASCIIType_I2 = 2,
    ASCIIType_I4 = 3,
    ASCIIType_R4 = 4,
    ASCIIType_R8 = 5,
    ASCIIType_BSTR = 8,
    ASCIIType_Any = 12,
    ASCIIType_UI1 = 17,
};

// Element types of the binary-block operations.
enum IEEEBinaryType : LONG {
    BinaryType_I2 = 2,
    BinaryType_I4 = 3,
    BinaryType_R4 = 4,
    BinaryType_R8 = 5,
    BinaryType_UI1 = 17,
};

// IFormattedIO488::SetBufferSize masks.
enum BufferMask : LONG { IO_IN_BUF = 16, IO_OUT_BUF = 32 };

// Why a read stopped (IMessageDirect::ReadInto).
enum ReadEnd : LONG {
    kReadEndCount = 0,      // the requested count was reached
    kReadEndTermChar = 1,   // the termination character was read (and is in the data)
    kReadEndEnd = 2,        // the device marked the end of its message (END)
    kReadEndAvailable = 3,  // kReadAvailable: no more data was waiting
};

// IMessageDirect::ReadInto flags.
enum ReadFlags : DWORD {
    kReadDefault = 0,
    kReadIgnoreTermChar = 1,  // binary data: only END or the count ends the read
    kReadAvailable = 2,       // return as soon as some data has arrived and no more waits
    // Read to the end of the message whatever the termination-character
    // setting: END where the bus has it, else the line feed (raw sockets and
    // serial lines, whose only message end it is).
    kReadToMessageEnd = 4,
};

}  // namespace qn::visa

struct IMessage;

// An open instrument session.
struct IVisaSession : IUnknown {
    QN_INTERFACE_ID("5b0c6a31-8d0e-4f7a-9c1e-3a6f2d8b7c01");
    virtual HRESULT get_HardwareInterfaceType(SHORT* pVal) = 0;
    virtual HRESULT get_HardwareInterfaceNumber(SHORT* pVal) = 0;  // the board number
    virtual HRESULT get_ResourceClass(BSTR* pVal) = 0;             // "INSTR", "SOCKET"
    virtual HRESULT get_ResourceName(BSTR* pVal) = 0;              // canonical form
    virtual HRESULT get_Timeout(LONG* pVal) = 0;
    virtual HRESULT put_Timeout(LONG val) = 0;
    // Ends the connection; later I/O fails with E_VISA_INVALID_OBJECT.
    virtual HRESULT Close() = 0;
    // Takes the exclusive lock of the device (type kExclusiveLock), waiting
    // up to lockTimeout ms (0: only if it is free now) for another link to
    // release it; E_VISA_RSRC_LOCKED when it stays taken. Locks nest: each
    // LockRsrc needs its UnlockRsrc. requestedKey is for shared locks (not
    // offered); *accessKey (may be null) receives an empty string.
    virtual HRESULT LockRsrc(LONG type, LONG lockTimeout, BSTR requestedKey, BSTR* accessKey) = 0;
    // Gives back one LockRsrc; E_VISA_SESSION_NOT_LOCKED when none is held.
    virtual HRESULT UnlockRsrc() = 0;
    // kNoLock or kExclusiveLock.
    virtual HRESULT get_LockState(LONG* pVal) = 0;
};

// Message-based I/O of a session.
struct IMessage : IVisaSession {
    QN_INTERFACE_ID("5b0c6a31-8d0e-4f7a-9c1e-3a6f2d8b7c02");
    // Device clear: discards unread input and, where the bus has one, sends
    // the clear command. A raw socket has no out-of-band clear: there it only
    // discards what was received and not yet read, and sends nothing.
    virtual HRESULT Clear() = 0;
    // Status byte. A raw socket has no serial poll: the session sends "*STB?"
    // and reads the integer reply (IEEE 488.2 common query).
    virtual HRESULT ReadSTB(SHORT* pStatusByte) = 0;
    // Reads at most count bytes; the read ends at END, at the termination
    // character when enabled, or at count. *pBuffer is a new VT_UI1 array
    // holding exactly the bytes read.
    virtual HRESULT Read(LONG count, SAFEARRAY** pBuffer) = 0;
    // As Read, the bytes taken as UTF-8 (invalid sequences become U+FFFD).
    virtual HRESULT ReadString(LONG count, BSTR* pBuffer) = 0;
    // Writes the first count bytes of *buffer (-1: the whole array).
    virtual HRESULT Write(SAFEARRAY** buffer, LONG count, LONG* pRetCount) = 0;
    // Writes the string as UTF-8; *pRetCount is the count of bytes written.
    virtual HRESULT WriteString(BSTR buffer, LONG* pRetCount) = 0;
    virtual HRESULT get_SendEndEnabled(VARIANT_BOOL* pVal) = 0;
    virtual HRESULT put_SendEndEnabled(VARIANT_BOOL val) = 0;
    virtual HRESULT get_TerminationCharacter(BYTE* pVal) = 0;
    virtual HRESULT put_TerminationCharacter(BYTE val) = 0;
    virtual HRESULT get_TerminationCharacterEnabled(VARIANT_BOOL* pVal) = 0;
    virtual HRESULT put_TerminationCharacterEnabled(VARIANT_BOOL val) = 0;
    // Triggers the device the way its bus does (kTriggerProtocolDefault
    // only): VXI-11 device_trigger, the HiSLIP Trigger message, the USBTMC
    // trigger request; a socket or serial line sends the "*TRG" common
    // command.
    virtual HRESULT AssertTrigger(SHORT protocol) = 0;
};

// Register-based I/O. Message-based sessions (sockets, LAN and USB
// instruments, serial ports) do not offer it: QueryInterface fails.
struct IRegister : IVisaSession {
    QN_INTERFACE_ID("5b0c6a31-8d0e-4f7a-9c1e-3a6f2d8b7c03");
    virtual HRESULT In8(SHORT space, LONG offset, BYTE* pVal) = 0;
    virtual HRESULT In16(SHORT space, LONG offset, SHORT* pVal) = 0;
    virtual HRESULT In32(SHORT space, LONG offset, LONG* pVal) = 0;
    virtual HRESULT Out8(SHORT space, LONG offset, BYTE val) = 0;
    virtual HRESULT Out16(SHORT space, LONG offset, SHORT val) = 0;
    virtual HRESULT Out32(SHORT space, LONG offset, LONG val) = 0;
    virtual HRESULT MoveIn8(SHORT space, LONG offset, LONG length, SAFEARRAY** pBuf) = 0;
    virtual HRESULT MoveIn16(SHORT space, LONG offset, LONG length, SAFEARRAY** pBuf) = 0;
    virtual HRESULT MoveIn32(SHORT space, LONG offset, LONG length, SAFEARRAY** pBuf) = 0;
    virtual HRESULT MoveOut8(SHORT space, LONG offset, LONG length, SAFEARRAY** buf) = 0;
    virtual HRESULT MoveOut16(SHORT space, LONG offset, LONG length, SAFEARRAY** buf) = 0;
    virtual HRESULT MoveOut32(SHORT space, LONG offset, LONG length, SAFEARRAY** buf) = 0;
};

// Reads and writes through the caller's memory, without SAFEARRAY or BSTR
// conversions. Offered by every message-based session.
struct IMessageDirect : IUnknown {
    QN_INTERFACE_ID("5b0c6a31-8d0e-4f7a-9c1e-3a6f2d8b7c04");
    // Reads at most count bytes into buf (ReadFlags in flags). *pActual is
    // set to the bytes stored, also when the read fails (e.g. on timeout);
    // *pEnd (may be null) tells why the read stopped.
    virtual HRESULT ReadInto(BYTE* buf, LONG count, DWORD flags, LONG* pActual, LONG* pEnd) = 0;
    // Writes count bytes; *pActual (may be null) receives the count written.
    virtual HRESULT WriteFrom(const BYTE* buf, LONG count, LONG* pActual) = 0;
    // One deadline for several calls. From BeginOperation to the matching
    // EndOperation, every read, write, clear and status-byte read that the
    // calling thread makes on the session ends by one deadline: the session
    // timeout counted from BeginOperation. Pairs nest (the outermost pair
    // sets the deadline). S_OK opens a pair that EndOperation must close;
    // S_FALSE (another thread has an operation open) opens none.
    virtual HRESULT BeginOperation() = 0;
    virtual HRESULT EndOperation() = 0;
    // VARIANT_TRUE when the bus marks the end of a message (END); false for
    // raw sockets and serial lines, where only a line feed can end one.
    virtual HRESULT get_HasEnd(VARIANT_BOOL* pVal) = 0;
};

// The resource manager: opens sessions by resource string.
struct IResourceManager : IUnknown {
    QN_INTERFACE_ID("5b0c6a31-8d0e-4f7a-9c1e-3a6f2d8b7c05");
    // resourceName: see ParseResourceName (resource_name.h). openTimeout
    // bounds the connection set-up (ms; 0 or below, except -1 for no limit,
    // gives kDefaultOpenTimeoutMs). accessMode kExclusiveLock opens the
    // session with the device's exclusive lock, waiting up to openTimeout
    // for it; kSharedLock is not offered. optionString is accepted and
    // ignored.
    // Fails with E_VISA_INVALID_RESOURCE_NAME for a malformed string and
    // E_VISA_RESOURCE_NOT_FOUND when the resource cannot be reached or its
    // kind has no transport in this build.
    virtual HRESULT Open(BSTR resourceName, LONG accessMode, LONG openTimeout, BSTR optionString,
                         IVisaSession** ppSession) = 0;
};

// IEEE 488.2 formatted I/O over a bound IMessage: buffered writes, and
// parsing of strings, numbers, lists and binary blocks from replies.
struct IFormattedIO488 : IUnknown {
    QN_INTERFACE_ID("5b0c6a31-8d0e-4f7a-9c1e-3a6f2d8b7c06");
    virtual HRESULT get_IO(IMessage** ppIO) = 0;
    // Binds a session (null unbinds). Pending buffered data is discarded.
    virtual HRESULT put_IO(IMessage* pIO) = 0;
    // Byte order of multi-byte elements in binary blocks; true (the IEEE
    // 488.2 default) by default.
    virtual HRESULT get_InstrumentBigEndian(VARIANT_BOOL* pVal) = 0;
    virtual HRESULT put_InstrumentBigEndian(VARIANT_BOOL val) = 0;

    // Writes go to the write buffer and leave when it is full or when
    // flushAndEND is true. Nothing is appended: the text is sent as given.
    virtual HRESULT WriteString(BSTR data, VARIANT_BOOL flushAndEND) = 0;
    virtual HRESULT WriteNumber(VARIANT data, LONG type, VARIANT_BOOL flushAndEND) = 0;
    // data holds an array (or a single value); elements joined by
    // listSeparator (null: ",").
    virtual HRESULT WriteList(VARIANT* data, LONG type, BSTR listSeparator,
                              VARIANT_BOOL flushAndEND) = 0;
    // command, then a definite-length block "#<n><len><bytes>" of the array
    // in data (its element type decides the element size).
    virtual HRESULT WriteIEEEBlock(BSTR command, VARIANT data, VARIANT_BOOL flushAndEND) = 0;

    // The rest of the current reply message, up to and including its end
    // (the termination character when enabled).
    virtual HRESULT ReadString(BSTR* pString) = 0;
    // The next number of the reply (NR1/NR2/NR3, #H/#Q/#B, INF/NAN), as type.
    virtual HRESULT ReadNumber(LONG type, VARIANT_BOOL flushToEND, VARIANT* pData) = 0;
    // The rest of the reply split at listSeparator (null: ","), as an array of type.
    virtual HRESULT ReadList(LONG type, BSTR listSeparator, VARIANT* pData) = 0;
    // A binary block as an array of type. seekToBlock skips anything before
    // the '#'; flushToEND discards the rest of the message afterwards.
    virtual HRESULT ReadIEEEBlock(LONG type, VARIANT_BOOL seekToBlock, VARIANT_BOOL flushToEND,
                                  VARIANT* pData) = 0;
    // Sends the write buffer (sendEND: mark the end of the message where the
    // bus can).
    virtual HRESULT FlushWrite(VARIANT_BOOL sendEND) = 0;
    // Discards the read buffer and the unread rest of the current message.
    virtual HRESULT FlushRead() = 0;
    // mask: IO_IN_BUF and/or IO_OUT_BUF; size in bytes (at least 16).
    virtual HRESULT SetBufferSize(LONG mask, LONG size) = 0;
};

// Where the data of a binary block goes once its header told the length: a
// receiver that keeps one buffer across reads hands out room for `bytes`
// bytes, or null when it cannot have that much (the read then fails with
// E_OUTOFMEMORY and the session stays in step).
struct IBlockSink {
    virtual BYTE* Reserve(std::size_t bytes) = 0;

  protected:
    ~IBlockSink() = default;
};

// Block reads into the caller's memory (no SAFEARRAY, no VARIANT), and the
// bound on declared block lengths.
struct IFormattedIO488Direct : IUnknown {
    QN_INTERFACE_ID("5b0c6a31-8d0e-4f7a-9c1e-3a6f2d8b7c07");
    // Reads a binary block of elements of type into buf, room for maxCount
    // elements. *pActualCount receives the elements stored. A block with more
    // elements than maxCount is read to its end (the session stays in step)
    // and fails with E_VISA_USER_BUFFER after storing the first maxCount.
    virtual HRESULT ReadIEEEBlockInto(LONG type, void* buf, LONG maxCount, LONG* pActualCount,
                                      VARIANT_BOOL seekToBlock, VARIANT_BOOL flushToEND) = 0;
    // Reads a binary block of elements of type into the room sink->Reserve
    // gives for the whole block (asked once, after the header). Elements are
    // in host order afterwards; *pActualCount receives the elements stored.
    virtual HRESULT ReadIEEEBlockToSink(LONG type, IBlockSink* sink, LONG* pActualCount,
                                        VARIANT_BOOL seekToBlock, VARIANT_BOOL flushToEND) = 0;
    // Largest block length (bytes) accepted from a header; longer blocks fail
    // with E_VISA_INVALID_FORMAT before anything is allocated.
    virtual HRESULT get_MaxBlockBytes(LONGLONG* pVal) = 0;
    virtual HRESULT put_MaxBlockBytes(LONGLONG val) = 0;
};

namespace qn::visa {

// Default bound on declared block lengths: the largest record (64 MiB) plus
// room for a header and padding.
constexpr LONGLONG kDefaultMaxBlockBytes = 64LL * 1024 * 1024 + 1024 * 1024;

// New objects holding one reference each; E_POINTER for a null argument,
// E_OUTOFMEMORY when allocation fails.
HRESULT CreateResourceManager(IResourceManager** ppManager);
HRESULT CreateFormattedIO488(IFormattedIO488** ppFormatted);

}  // namespace qn::visa
