#include "main/result_directory.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <memory>

#include "zxml/QAXfile.h"

namespace cvn {

std::string WorkingDirectory::path() {
  // getcwd with a system-allocated buffer: no length limit of our own.
  std::unique_ptr<char, decltype(&std::free)> cwd(::getcwd(nullptr, 0), &std::free);
  return cwd ? std::string(cwd.get()) : std::string(".");
}

bool WorkingDirectory::isTaken(const std::string& full_path) {
  std::FILE* f = std::fopen(full_path.c_str(), "r");
  if (!f) return false;
  std::fclose(f);
  return true;
}

bool WorkingDirectory::writeFile(const std::string& full_path, const std::vector<uint8_t>& image) {
  return writeImageFile(full_path, image);
}

int64_t SystemClock::now() { return static_cast<int64_t>(std::time(nullptr)); }

}  // namespace cvn
