// Large receive buffers are mapped directly, in whole huge-page units where
// the kernel offers them: an 8,000,000-point record then costs a few dozen
// page faults the first time and none afterwards.
#include "io/receive_buffer.h"

#include <sys/mman.h>

#include <cstdint>

namespace qn {

namespace {

constexpr std::size_t kGranule = std::size_t(2) << 20;  // a huge page on x86-64 and arm64

std::uintptr_t RoundUp(std::uintptr_t n) { return (n + kGranule - 1) / kGranule * kGranule; }

}  // namespace

ReceiveBuffer::ReceiveBuffer(std::size_t limit) : limit_(limit) {}

ReceiveBuffer::~ReceiveBuffer() { Release(); }

BYTE* ReceiveBuffer::Reserve(std::size_t bytes) {
    if (bytes > limit_) return nullptr;
    if (bytes <= capacity_) return data_;
    Release();
    const std::size_t size = RoundUp(bytes);
    // One granule more than needed, then the unaligned ends cut off, so the
    // whole buffer lies in huge pages.
    void* p = ::mmap(nullptr, size + kGranule, PROT_READ | PROT_WRITE,
                     MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (p == MAP_FAILED) return nullptr;
    auto* raw = static_cast<BYTE*>(p);
    BYTE* start = raw + (RoundUp(reinterpret_cast<std::uintptr_t>(raw)) -
                         reinterpret_cast<std::uintptr_t>(raw));
    if (start > raw) ::munmap(raw, std::size_t(start - raw));
    if (start + size < raw + size + kGranule)
        ::munmap(start + size, std::size_t(raw + size + kGranule - (start + size)));
#ifdef MADV_HUGEPAGE
    ::madvise(start, size, MADV_HUGEPAGE);  // a hint: without huge pages the buffer still works
#endif
    data_ = start;
    capacity_ = size;
    return data_;
}

void ReceiveBuffer::Release() {
    if (data_) ::munmap(data_, capacity_);
    data_ = nullptr;
    capacity_ = 0;
}

}  // namespace qn
