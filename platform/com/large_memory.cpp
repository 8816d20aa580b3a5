#include "platform/com/large_memory.h"

#include <sys/mman.h>

#include <cstdint>

namespace qn::com {

namespace {

constexpr std::size_t kGranule = std::size_t(2) << 20;  // a huge page on x86-64 and arm64

std::uintptr_t RoundUp(std::uintptr_t n) { return (n + kGranule - 1) / kGranule * kGranule; }

}  // namespace

void* MapLargeMemory(std::size_t bytes, std::size_t* mapped) {
    if (bytes > SIZE_MAX - 2 * kGranule) return nullptr;
    const std::size_t size = RoundUp(bytes);
    // One granule more than needed, then the unaligned ends cut off, so the
    // whole block lies in huge pages.
    void* p = ::mmap(nullptr, size + kGranule, PROT_READ | PROT_WRITE,
                     MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (p == MAP_FAILED) return nullptr;
    auto* raw = static_cast<char*>(p);
    const auto base = reinterpret_cast<std::uintptr_t>(raw);
    char* start = raw + (RoundUp(base) - base);
    if (start > raw) ::munmap(raw, std::size_t(start - raw));
    char* end = raw + size + kGranule;
    if (start + size < end) ::munmap(start + size, std::size_t(end - (start + size)));
#ifdef MADV_HUGEPAGE
    ::madvise(start, size, MADV_HUGEPAGE);
#endif
    *mapped = size;
    return start;
}

void UnmapLargeMemory(void* p, std::size_t mapped) {
    if (p) ::munmap(p, mapped);
}

}  // namespace qn::com
