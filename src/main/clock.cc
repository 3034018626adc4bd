#include "main/clock.h"

#include <ctime>

namespace cvn {

int64_t SystemClock::now() { return static_cast<int64_t>(std::time(nullptr)); }

}  // namespace cvn
