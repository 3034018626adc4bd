// Where the result file goes: the working directory, probed for free names
// and written through this seam so that a test can run the whole driver,
// failing writes included, without touching the disk.
#ifndef CVN_MAIN_RESULT_DIRECTORY_H_
#define CVN_MAIN_RESULT_DIRECTORY_H_

#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace cvn {

/// What became of one attempt to save under a name.
enum class SaveOutcome { kSaved, kNameTaken, kFailed };

class ResultDirectory {
 public:
  virtual ~ResultDirectory() = default;
  /// The directory's path, as the report line shows it.
  virtual std::string path() = 0;
  /// True when anything at all bears `full_path`: a file, a directory, a
  /// FIFO, a link (dangling or not). Never blocks, never follows a link.
  virtual bool isTaken(const std::string& full_path) = 0;
  /// Puts the whole image under `full_path`, and only once it is complete;
  /// never through a link and never in place of anything that bears the
  /// name (kNameTaken: something took it first). A failure leaves nothing
  /// behind.
  virtual SaveOutcome writeFile(const std::string& full_path,
                                const std::vector<uint8_t>& image) = 0;
};

/// The process's current directory (or `folder`) on the local disk. The image
/// is written to a hidden temporary file in the same directory (".cvnmacagent-
/// PID.tmp": a console imports neither hidden names nor other endings), made
/// durable with fsync, and then given its name with link(), which creates the
/// name exclusively and fails when anything bears it. File systems without
/// hard links get the name claimed by an exclusive create and the temporary
/// file renamed over that empty claim. SIGINT, SIGTERM and SIGHUP during the
/// save remove what it created before the signal ends the process.
class WorkingDirectory : public ResultDirectory {
 public:
  WorkingDirectory() = default;
  explicit WorkingDirectory(std::string folder) : folder_(std::move(folder)) {}

  std::string path() override;
  bool isTaken(const std::string& full_path) override;
  SaveOutcome writeFile(const std::string& full_path, const std::vector<uint8_t>& image) override;

 protected:
  /// The disk steps a test can make fail, as a full disk or a file system
  /// without hard links would; both behave as write(2) and link(2).
  virtual ssize_t writeSome(int fd, const uint8_t* data, size_t size);
  virtual int linkName(const char* existing, const char* new_name);

 private:
  std::string folder_;
};

}  // namespace cvn

#endif  // CVN_MAIN_RESULT_DIRECTORY_H_
