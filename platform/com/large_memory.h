// Large blocks of memory mapped straight from the kernel, in whole huge-page
// units where the kernel offers them (a hint; plain pages otherwise). A
// 64 MB waveform array then costs a few dozen page faults instead of sixteen
// thousand, and giving it back returns it to the system at once. The memory
// reads as zeros.
#pragma once

#include <cstddef>

namespace qn::com {

// Blocks at least this large are worth mapping; smaller ones come from the heap.
inline constexpr std::size_t kLargeMemoryBytes = std::size_t(4) << 20;

// At least `bytes` bytes aligned to 2 MB; *mapped receives the size to give
// back. Null when the memory cannot be had.
void* MapLargeMemory(std::size_t bytes, std::size_t* mapped);
void UnmapLargeMemory(void* p, std::size_t mapped);

}  // namespace qn::com
