#include "main/result_directory.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <memory>

#include "collect/interrupt_signals.h"

namespace cvn {
namespace {

// What an interrupted save must remove: the temporary file, and the claimed
// name on a file system without hard links. The signal handler reads these,
// so they only change while the signals are held back.
const char* volatile g_pending[2] = {nullptr, nullptr};

extern "C" void removePendingAndRaise(int signal_number) {
  for (const char* volatile& path : g_pending) {
    const char* p = path;
    if (p) ::unlink(p);
  }
  // SA_RESETHAND has put the default action back: raised again, the signal
  // ends the process as it would have without the save.
  ::raise(signal_number);
}

// Holds the cleanup signals back for a scope, so that a file is never on the
// disk without being in g_pending, nor in g_pending once it is the result.
class HeldSignals {
 public:
  HeldSignals() {
    sigset_t set = interruptSignalSet();
    sigprocmask(SIG_BLOCK, &set, &old_);
  }
  // Keeps errno: callers read it after the step this scope guarded.
  ~HeldSignals() {
    int error = errno;
    sigprocmask(SIG_SETMASK, &old_, nullptr);
    errno = error;
  }
  HeldSignals(const HeldSignals&) = delete;
  HeldSignals& operator=(const HeldSignals&) = delete;

 private:
  sigset_t old_;
};

// A file this save created and removes again unless told to keep it.
class PendingFile {
 public:
  explicit PendingFile(size_t slot) : slot_(slot) {}
  ~PendingFile() {
    if (fd_ >= 0) ::close(fd_);
    remove();
  }
  PendingFile(const PendingFile&) = delete;
  PendingFile& operator=(const PendingFile&) = delete;

  /// Creates `path` exclusively and never through a link: anything that
  /// bears the name, a dangling link included, makes it fail with EEXIST.
  bool create(const std::string& path) {
    HeldSignals held;
    fd_ = ::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW, 0666);
    if (fd_ < 0) return false;
    path_ = path;
    g_pending[slot_] = path_.c_str();
    return true;
  }
  int fd() const { return fd_; }
  bool close() {
    int fd = fd_;
    fd_ = -1;
    return ::close(fd) == 0;
  }
  const std::string& path() const { return path_; }
  /// The file's name now belongs to the result; nothing is removed.
  void keep() {
    HeldSignals held;
    g_pending[slot_] = nullptr;
    path_.clear();
  }

 private:
  void remove() {
    if (path_.empty()) return;
    HeldSignals held;
    ::unlink(path_.c_str());
    g_pending[slot_] = nullptr;
    path_.clear();
  }

  size_t slot_;
  int fd_ = -1;
  std::string path_;
};

constexpr int kTemporaryAttempts = 100;

// Hidden and without the result's ending, so that no console imports it.
std::string temporaryPath(const std::string& folder, int attempt) {
  std::string path = folder + "/.cvnmacagent-" + std::to_string(::getpid());
  if (attempt > 0) path += "-" + std::to_string(attempt);
  return path + ".tmp";
}

std::string folderOf(const std::string& full_path) {
  size_t slash = full_path.rfind('/');
  if (slash == std::string::npos) return ".";
  return slash == 0 ? "/" : full_path.substr(0, slash);
}

// A name that link() cannot make on this file system (FAT on a USB stick,
// some network shares), rather than a name that is taken or refused.
bool withoutHardLinks(int error) {
  return error == EPERM || error == ENOTSUP || error == EOPNOTSUPP || error == ENOSYS;
}

// The new name survives a power cut only once its directory is on the disk
// too. Not every file system can sync a directory; the data is safe anyway.
void syncFolder(const std::string& folder) {
  int fd = ::open(folder.c_str(), O_RDONLY);
  if (fd < 0) return;
  ::fsync(fd);
  ::close(fd);
}

}  // namespace

std::string WorkingDirectory::path() {
  if (!folder_.empty()) return folder_;
  // getcwd with a system-allocated buffer: no length limit of our own.
  std::unique_ptr<char, decltype(&std::free)> cwd(::getcwd(nullptr, 0), &std::free);
  return cwd ? std::string(cwd.get()) : std::string(".");
}

bool WorkingDirectory::isTaken(const std::string& full_path) {
  // lstat opens nothing, so a FIFO cannot block the probe and a link counts
  // as itself. Any other failure is left to the exclusive creation to judge.
  struct stat st;
  return ::lstat(full_path.c_str(), &st) == 0 || errno == EOVERFLOW;
}

ssize_t WorkingDirectory::writeSome(int fd, const uint8_t* data, size_t size) {
  return ::write(fd, data, size);
}

int WorkingDirectory::linkName(const char* existing, const char* new_name) {
  return ::link(existing, new_name);
}

SaveOutcome WorkingDirectory::writeFile(const std::string& full_path,
                                        const std::vector<uint8_t>& image) {
  // For the length of the save: an interrupted one ends as it would have
  // without it, once what it made is removed.
  InterruptHandlers cleanup(removePendingAndRaise, SA_RESETHAND);
  const std::string folder = folderOf(full_path);
  PendingFile temporary(0);
  bool created = false;
  for (int attempt = 0; attempt < kTemporaryAttempts && !created; ++attempt) {
    created = temporary.create(temporaryPath(folder, attempt));
    if (!created && errno != EEXIST) return SaveOutcome::kFailed;
  }
  if (!created) return SaveOutcome::kFailed;

  const uint8_t* data = image.data();
  size_t left = image.size();
  while (left > 0) {
    ssize_t n = writeSome(temporary.fd(), data, left);
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) return SaveOutcome::kFailed;
    data += n;
    left -= static_cast<size_t>(n);
  }
  // Some file systems report a full disk or a lost connection only here.
  if (::fsync(temporary.fd()) != 0 || !temporary.close()) return SaveOutcome::kFailed;

  // link() gives the complete file its name and fails when anything bears
  // that name; it never replaces and never follows a link there.
  if (linkName(temporary.path().c_str(), full_path.c_str()) == 0) {
    syncFolder(folder);
    return SaveOutcome::kSaved;
  }
  const int error = errno;
  if (error == EEXIST) return SaveOutcome::kNameTaken;
  if (!withoutHardLinks(error)) return SaveOutcome::kFailed;

  // Without hard links: claim the name with an exclusive empty file, then
  // rename the temporary file over that claim, which is all it can replace.
  PendingFile claim(1);
  if (!claim.create(full_path))
    return errno == EEXIST ? SaveOutcome::kNameTaken : SaveOutcome::kFailed;
  if (!claim.close()) return SaveOutcome::kFailed;
  {
    HeldSignals held;
    if (::rename(temporary.path().c_str(), full_path.c_str()) != 0) return SaveOutcome::kFailed;
    claim.keep();
    temporary.keep();
  }
  syncFolder(folder);
  return SaveOutcome::kSaved;
}

}  // namespace cvn
