#if !defined(__APPLE__)
#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "collect/process_table.h"

namespace cvn {
namespace {

bool isNumber(const char* s) {
  if (!*s) return false;
  for (; *s; ++s)
    if (*s < '0' || *s > '9') return false;
  return true;
}

// /proc/PID/stat: "pid (comm) state ppid ...". The name may hold blanks and
// parentheses, so it ends at the last ")". Read with plain system calls
// into one buffer: the table is read once per scan, but on a busy machine
// it has thousands of entries and stream set-up per file was most of the
// cost.
bool readStat(int proc, const char* pid_text, int64_t pid, ProcessEntry* entry) {
  char path[48];
  std::snprintf(path, sizeof path, "%s/stat", pid_text);
  int fd = openat(proc, path, O_RDONLY | O_CLOEXEC);
  if (fd < 0) return false;  // gone since the directory was listed
  // The name is at most 64 bytes; the fields up to the ppid fit easily.
  char buffer[512];
  size_t size = 0;
  for (ssize_t got; size < sizeof buffer - 1; size += static_cast<size_t>(got)) {
    got = ::read(fd, buffer + size, sizeof buffer - 1 - size);
    if (got < 0 && errno == EINTR) {
      got = 0;
      continue;
    }
    if (got <= 0) break;
    // The kernel hands the whole line in one read; asking again only to be
    // told it ended is one system call per process on a busy machine.
    if (buffer[size + static_cast<size_t>(got) - 1] == '\n') {
      size += static_cast<size_t>(got);
      break;
    }
  }
  ::close(fd);
  std::string_view stat(buffer, size);
  size_t open = stat.find('(');
  size_t close = stat.rfind(')');
  if (open == std::string_view::npos || close == std::string_view::npos || close < open)
    return false;
  buffer[size] = '\0';
  char state = 0;
  long long ppid = 0;
  if (std::sscanf(buffer + close + 1, " %c %lld", &state, &ppid) != 2) return false;
  entry->pid = pid;
  entry->ppid = ppid;
  entry->short_name.assign(stat.substr(open + 1, close - open - 1));
  return true;
}

class ProcFsProcessTable : public ProcessTable {
 public:
  bool read(std::vector<ProcessEntry>* entries) override {
    DIR* dir = opendir("/proc");
    if (!dir) return false;
    std::vector<std::pair<int64_t, std::string>> pids;
    while (struct dirent* e = readdir(dir)) {
      if (isNumber(e->d_name)) pids.emplace_back(std::strtoll(e->d_name, nullptr, 10), e->d_name);
    }
    std::sort(pids.begin(), pids.end());
    entries->clear();
    entries->reserve(pids.size());
    for (const auto& pid : pids) {
      ProcessEntry entry;
      if (readStat(dirfd(dir), pid.second.c_str(), pid.first, &entry))
        entries->push_back(std::move(entry));  // skip vanished ones
    }
    closedir(dir);
    return true;
  }
};

}  // namespace

std::unique_ptr<ProcessTable> makeSystemProcessTable() {
  return std::make_unique<ProcFsProcessTable>();
}

}  // namespace cvn
#endif  // !__APPLE__
