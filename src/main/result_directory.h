// Where the result file goes: the working directory, probed for free names
// and written through this seam so that a test can run the whole driver,
// failing writes included, without touching the disk.
#ifndef CVN_MAIN_RESULT_DIRECTORY_H_
#define CVN_MAIN_RESULT_DIRECTORY_H_

#include <cstdint>
#include <string>
#include <vector>

namespace cvn {

class ResultDirectory {
 public:
  virtual ~ResultDirectory() = default;
  /// The directory's path, as the report line shows it.
  virtual std::string path() = 0;
  /// True when `full_path` is already taken.
  virtual bool isTaken(const std::string& full_path) = 0;
  /// Writes the whole image under `full_path`; false when it cannot.
  virtual bool writeFile(const std::string& full_path, const std::vector<uint8_t>& image) = 0;
};

/// The process's current directory on the local disk.
class WorkingDirectory : public ResultDirectory {
 public:
  std::string path() override;
  bool isTaken(const std::string& full_path) override;
  bool writeFile(const std::string& full_path, const std::vector<uint8_t>& image) override;
};

/// The scan's clock, in seconds since 1970.
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

#endif  // CVN_MAIN_RESULT_DIRECTORY_H_
