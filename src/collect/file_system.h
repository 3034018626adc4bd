// Reads of the local file system, behind an interface so that builders which
// walk folders can be tested against an in-memory tree.
#ifndef CVN_COLLECT_FILE_SYSTEM_H_
#define CVN_COLLECT_FILE_SYSTEM_H_

#include <cstddef>
#include <string>
#include <vector>

namespace cvn {

class FileSystem {
 public:
  virtual ~FileSystem() = default;
  /// The names of the entries of the directory `path`, without "." and "..",
  /// in byte order; empty when it is missing or cannot be read.
  virtual std::vector<std::string> listDirectory(const std::string& path) = 0;
  /// True when `path` names a directory (after following links).
  virtual bool isDirectory(const std::string& path) = 0;
  /// At most `max_bytes` bytes from the start of the file into `out`; false
  /// (and `out` empty) when it cannot be read.
  virtual bool readFile(const std::string& path, size_t max_bytes, std::string* out) = 0;
};

/// opendir/stat/open on the local machine.
class PosixFileSystem : public FileSystem {
 public:
  std::vector<std::string> listDirectory(const std::string& path) override;
  bool isDirectory(const std::string& path) override;
  bool readFile(const std::string& path, size_t max_bytes, std::string* out) override;
};

/// The process-wide file system used by the scan.
FileSystem& systemFileSystem();

}  // namespace cvn

#endif  // CVN_COLLECT_FILE_SYSTEM_H_
