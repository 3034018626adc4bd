#if !defined(__APPLE__)
#include <dirent.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>

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
// parentheses, so it ends at the last ")".
bool readStat(int64_t pid, ProcessEntry* entry) {
  std::ifstream file("/proc/" + std::to_string(pid) + "/stat");
  if (!file) return false;
  std::stringstream text;
  text << file.rdbuf();
  std::string stat = text.str();
  size_t open = stat.find('(');
  size_t close = stat.rfind(')');
  if (open == std::string::npos || close == std::string::npos || close < open) return false;
  char state = 0;
  long long ppid = 0;
  if (std::sscanf(stat.c_str() + close + 1, " %c %lld", &state, &ppid) != 2) return false;
  entry->pid = pid;
  entry->ppid = ppid;
  entry->short_name = stat.substr(open + 1, close - open - 1);
  return true;
}

class ProcFsProcessTable : public ProcessTable {
 public:
  bool read(std::vector<ProcessEntry>* entries) override {
    DIR* dir = opendir("/proc");
    if (!dir) return false;
    std::vector<int64_t> pids;
    while (struct dirent* e = readdir(dir)) {
      if (isNumber(e->d_name)) pids.push_back(std::strtoll(e->d_name, nullptr, 10));
    }
    closedir(dir);
    std::sort(pids.begin(), pids.end());
    entries->clear();
    for (int64_t pid : pids) {
      ProcessEntry entry;
      if (readStat(pid, &entry)) entries->push_back(std::move(entry));  // skip vanished ones
    }
    return true;
  }
};

}  // namespace

std::unique_ptr<ProcessTable> makeSystemProcessTable() {
  return std::make_unique<ProcFsProcessTable>();
}

}  // namespace cvn
#endif  // !__APPLE__
