// The scan's clock: when collecting began and ended, and the result's date.
// A seam of its own, so that a test can run a whole scan at a fixed time.
#ifndef CVN_MAIN_CLOCK_H_
#define CVN_MAIN_CLOCK_H_

#include <cstdint>

namespace cvn {

/// Seconds since 1970.
class Clock {
 public:
  virtual ~Clock() = default;
  virtual int64_t now() = 0;
};

class SystemClock : public Clock {
 public:
  int64_t now() override;
};

}  // namespace cvn

#endif  // CVN_MAIN_CLOCK_H_
