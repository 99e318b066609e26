// Live heap bytes of the process, for telling whether memory use grows over a long run.
#pragma once

#include <cstddef>

namespace apefuzz {

// Bytes allocated and not yet freed: the sanitizer allocator's count under AddressSanitizer,
// the C library's otherwise.
std::size_t LiveHeapBytes();

}  // namespace apefuzz
