#if !defined(__APPLE__)

#include <unistd.h>

#include "collect/computer_name.h"

namespace cvn {

std::string readComputerName() {
  char name[256] = {};
  if (gethostname(name, sizeof name - 1) != 0) return std::string();
  return name;
}

}  // namespace cvn

#endif  // !defined(__APPLE__)
