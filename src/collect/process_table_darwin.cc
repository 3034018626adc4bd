#if defined(__APPLE__)
#include <sys/sysctl.h>
#include <sys/types.h>

#include <cerrno>
#include <cstring>
#include <vector>

#include "collect/process_table.h"

namespace cvn {
namespace {

class SysctlProcessTable : public ProcessTable {
 public:
  bool read(std::vector<ProcessEntry>* entries) override {
    int mib[3] = {CTL_KERN, KERN_PROC, KERN_PROC_ALL};
    for (;;) {
      size_t size = 0;
      if (sysctl(mib, 3, nullptr, &size, nullptr, 0) != 0) return false;
      std::vector<char> buffer(size);
      int result = sysctl(mib, 3, buffer.data(), &size, nullptr, 0);
      // The table grew between the two calls: measure again.
      if (result != 0 && errno == ENOMEM) continue;
      if (result != 0) return false;
      size_t count = size / sizeof(struct kinfo_proc);
      entries->clear();
      entries->reserve(count);
      for (size_t i = 0; i < count; ++i) {
        struct kinfo_proc proc;
        std::memcpy(&proc, buffer.data() + i * sizeof proc, sizeof proc);
        ProcessEntry entry;
        entry.pid = proc.kp_proc.p_pid;
        entry.ppid = proc.kp_eproc.e_ppid;
        entry.short_name.assign(proc.kp_proc.p_comm,
                                strnlen(proc.kp_proc.p_comm, sizeof proc.kp_proc.p_comm));
        entries->push_back(std::move(entry));
      }
      return true;
    }
  }
};

}  // namespace

std::unique_ptr<ProcessTable> makeSystemProcessTable() {
  return std::make_unique<SysctlProcessTable>();
}

}  // namespace cvn
#endif  // __APPLE__
