// ReceiveBuffer: the session's memory for binary blocks (mapped in huge
// pages where the kernel offers them), kept from one read
// to the next so that a test program fetching the same record in a loop pays
// for the pages once, not at every call. It grows to the largest block read
// so far (never beyond its bound) and is released when the session closes.
#pragma once

#include <cstddef>

#include "platform/visa/visa.h"

namespace qn {

class ReceiveBuffer final : public IBlockSink {
public:
    // `limit`: the most bytes the buffer ever holds.
    explicit ReceiveBuffer(std::size_t limit);
    ~ReceiveBuffer();
    ReceiveBuffer(const ReceiveBuffer&) = delete;
    ReceiveBuffer& operator=(const ReceiveBuffer&) = delete;

    // Room for `bytes` bytes at the start of the buffer; null when that is
    // beyond the limit or the memory cannot be had. Growing drops the
    // earlier contents.
    BYTE* Reserve(std::size_t bytes) override;
    // Gives the memory back (the next Reserve maps it afresh).
    void Release();

    std::size_t capacity() const { return capacity_; }
    const BYTE* data() const { return data_; }

private:
    BYTE* data_ = nullptr;
    std::size_t capacity_ = 0;
    std::size_t limit_;
};

}  // namespace qn
