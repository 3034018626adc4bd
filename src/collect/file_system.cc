#include "collect/file_system.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace cvn {

std::vector<std::string> PosixFileSystem::listDirectory(const std::string& path) {
  std::vector<std::string> names;
  DIR* dir = ::opendir(path.c_str());
  if (!dir) return names;
  while (const dirent* entry = ::readdir(dir)) {
    if (std::strcmp(entry->d_name, ".") == 0 || std::strcmp(entry->d_name, "..") == 0) continue;
    names.emplace_back(entry->d_name);
  }
  ::closedir(dir);
  // readdir's order depends on the file system; the snapshot should not.
  std::sort(names.begin(), names.end());
  return names;
}

bool PosixFileSystem::isDirectory(const std::string& path) {
  struct stat info;
  return ::stat(path.c_str(), &info) == 0 && S_ISDIR(info.st_mode);
}

bool PosixFileSystem::readFile(const std::string& path, size_t max_bytes, std::string* out) {
  out->clear();
  // O_NONBLOCK keeps a FIFO planted where a file is expected from hanging
  // the scan.
  int fd = ::open(path.c_str(), O_RDONLY | O_NONBLOCK);
  if (fd < 0) return false;
  struct stat info;
  if (::fstat(fd, &info) != 0 || !S_ISREG(info.st_mode)) {
    ::close(fd);
    return false;
  }
  char buffer[16384];
  while (out->size() < max_bytes) {
    size_t want = std::min(sizeof buffer, max_bytes - out->size());
    ssize_t got = ::read(fd, buffer, want);
    if (got < 0 && errno == EINTR) continue;
    if (got <= 0) break;
    out->append(buffer, static_cast<size_t>(got));
  }
  ::close(fd);
  return true;
}

FileSystem& systemFileSystem() {
  static PosixFileSystem file_system;
  return file_system;
}

}  // namespace cvn
