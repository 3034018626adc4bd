// Inflating a result file's zlib streams within bounds: each stream on its
// own, and all that reading one file holds, together.
#ifndef CVN_TOOLS_QAX_INFLATE_H_
#define CVN_TOOLS_QAX_INFLATE_H_

#include <cstddef>
#include <cstdint>
#include <string>

namespace cvn {

/// The bytes reading one file may still hold.
class InflateBudget {
 public:
  explicit InflateBudget(uint64_t limit) : limit_(limit), left_(limit) {}
  /// Takes `bytes` from what is left; false, with `error` saying so, once
  /// they pass the limit.
  bool take(uint64_t bytes, std::string* error);

 private:
  uint64_t limit_;
  uint64_t left_;
};

/// Inflates one complete zlib stream that must fill `size` exactly, into at
/// most 256 MiB. Each inflated byte is taken from `budget` (may be null) as
/// it comes, so a stream past the budget is given up at once rather than
/// inflated to its end.
bool inflateWithin(const uint8_t* data, size_t size, std::string* out, InflateBudget* budget,
                   std::string* error);

}  // namespace cvn

#endif  // CVN_TOOLS_QAX_INFLATE_H_
