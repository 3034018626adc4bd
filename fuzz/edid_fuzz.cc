// The EDID text comes straight from the profiler's output; whatever it holds,
// decoding it must stay inside the block.
#include <cstddef>
#include <cstdint>
#include <string_view>

#include "sections/edid.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  cvn::EdidInfo info;
  cvn::decodeEdidText(std::string_view(reinterpret_cast<const char*>(data), size), &info);
  // Raw bytes too, so the timing tables see every bit pattern.
  cvn::decodeEdid(data, size, &info);
  return 0;
}
