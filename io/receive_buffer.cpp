#include "io/receive_buffer.h"

#include "platform/com/large_memory.h"

namespace qn {

ReceiveBuffer::ReceiveBuffer(std::size_t limit) : limit_(limit) {}

ReceiveBuffer::~ReceiveBuffer() { Release(); }

BYTE* ReceiveBuffer::Reserve(std::size_t bytes) {
    if (bytes > limit_) return nullptr;
    if (bytes <= capacity_) return data_;
    Release();
    std::size_t mapped = 0;
    data_ = static_cast<BYTE*>(com::MapLargeMemory(bytes, &mapped));
    capacity_ = data_ ? mapped : 0;
    return data_;
}

void ReceiveBuffer::Release() {
    com::UnmapLargeMemory(data_, capacity_);
    data_ = nullptr;
    capacity_ = 0;
}

}  // namespace qn
