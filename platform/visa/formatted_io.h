// IFormattedIO488 over a bound IMessage (which must also offer
// IMessageDirect, as every session of this library does).
//
// Reads go through a read buffer filled with what the session has (never
// past the end of the current message: the session's reads stop at the
// termination character); binary block data beyond the buffer goes straight
// from the session into the destination array or the caller's memory.
// Writes collect in a write buffer that leaves when full or on flush.
//
// A message ends at END or, when the session has it enabled, at the
// termination character. Each formatted operation is one operation of the
// session (IMessageDirect::BeginOperation): all its reads and writes end by
// one deadline, the session timeout counted from its start.
#pragma once

#include <mutex>
#include <string>
#include <vector>

#include "platform/visa/deadline.h"
#include "platform/visa/ieee488.h"
#include "platform/visa/visa.h"

namespace qn::visa {

class FormattedIO final
    : public qn::com::ComObject<FormattedIO, IFormattedIO488, IFormattedIO488Direct> {
  public:
    FormattedIO();

    // IFormattedIO488
    HRESULT get_IO(IMessage** ppIO) override;
    HRESULT put_IO(IMessage* pIO) override;
    HRESULT get_InstrumentBigEndian(VARIANT_BOOL* pVal) override;
    HRESULT put_InstrumentBigEndian(VARIANT_BOOL val) override;
    HRESULT WriteString(BSTR data, VARIANT_BOOL flushAndEND) override;
    HRESULT WriteNumber(VARIANT data, LONG type, VARIANT_BOOL flushAndEND) override;
    HRESULT WriteList(VARIANT* data, LONG type, BSTR listSeparator,
                      VARIANT_BOOL flushAndEND) override;
    HRESULT WriteIEEEBlock(BSTR command, VARIANT data, VARIANT_BOOL flushAndEND) override;
    HRESULT ReadString(BSTR* pString) override;
    HRESULT ReadNumber(LONG type, VARIANT_BOOL flushToEND, VARIANT* pData) override;
    HRESULT ReadList(LONG type, BSTR listSeparator, VARIANT* pData) override;
    HRESULT ReadIEEEBlock(LONG type, VARIANT_BOOL seekToBlock, VARIANT_BOOL flushToEND,
                          VARIANT* pData) override;
    HRESULT FlushWrite(VARIANT_BOOL sendEND) override;
    HRESULT FlushRead() override;
    HRESULT SetBufferSize(LONG mask, LONG size) override;

    // IFormattedIO488Direct
    HRESULT ReadIEEEBlockInto(LONG type, void* buf, LONG maxCount, LONG* pActualCount,
                              VARIANT_BOOL seekToBlock, VARIANT_BOOL flushToEND) override;
    HRESULT ReadIEEEBlockToSink(LONG type, IBlockSink* sink, LONG* pActualCount,
                                VARIANT_BOOL seekToBlock, VARIANT_BOOL flushToEND) override;
    HRESULT get_MaxBlockBytes(LONGLONG* pVal) override;
    HRESULT put_MaxBlockBytes(LONGLONG val) override;

  private:
    // Where a block's data goes once its size is known: *dst with room for
    // *room bytes (bytes beyond the room are read and dropped).
    class BlockTarget {
      public:
        virtual HRESULT Place(std::size_t bytes, BYTE** dst, std::size_t* room) = 0;

      protected:
        ~BlockTarget() = default;
    };
    struct BlockResult {
        std::size_t stored = 0;  // bytes placed at dst
        std::size_t total = 0;   // data bytes of the block
    };

    HRESULT Bound() const;
    Deadline OpDeadline() const;
    std::string_view Pending() const;
    void Consume(std::size_t n);
    // Adds what the session has of the current message to the read buffer
    // (extra: more ReadFlags for the session read).
    HRESULT Fill(const Deadline& deadline, DWORD extra = 0);
    HRESULT Settle(HRESULT hr);
    HRESULT StartMessage(const Deadline& deadline);
    HRESULT ReadRest(const Deadline& deadline, std::string* out, DWORD extra = 0);
    HRESULT ReadIndefiniteBody(const Deadline& deadline, std::string* data);
    HRESULT SkipSeparators(const Deadline& deadline, bool* at_end);
    HRESULT ReadField(LONG type, const Deadline& deadline, VARIANT* out);
    HRESULT DrainMessage(const Deadline& deadline);
    HRESULT Resync(HRESULT hr, const std::string& why);
    HRESULT ReadBlock(std::size_t elem, bool seek, bool flush, BlockTarget& target,
                      BlockResult* result);
    HRESULT ReadBlockHeader(bool seek, const Deadline& deadline, BlockHeader* h);
    HRESULT ReadDefiniteBody(std::size_t length, BYTE* dst, std::size_t room,
                             const Deadline& deadline, BlockResult* result);
    HRESULT Append(std::string_view bytes);
    HRESULT SendBuffer();
    HRESULT SendBlockData(const BYTE* data, std::size_t bytes, std::size_t elem);

    std::mutex m_;
    ComPtr<IMessage> io_;
    ComPtr<IMessageDirect> direct_;
    std::vector<BYTE> rbuf_;
    std::size_t rpos_ = 0, rend_ = 0;  // unread bytes are rbuf_[rpos_, rend_)
    bool open_message_ = false;        // part of a message was taken; its end not yet
    LONG last_end_ = kReadEndCount;    // why the last Fill stopped
    std::string wbuf_;
    std::size_t wsize_;
    bool big_endian_ = true;
    LONGLONG max_block_ = kDefaultMaxBlockBytes;
};

}  // namespace qn::visa
