// The signals a person or a session ends a run with: Ctrl-C, kill, a closed
// SSH connection. Both the tools' wait and the save act on them, and both
// leave a signal someone chose to ignore (nohup) or handle as it was.
#ifndef CVN_COLLECT_INTERRUPT_SIGNALS_H_
#define CVN_COLLECT_INTERRUPT_SIGNALS_H_

#include <csignal>
#include <cstddef>

namespace cvn {

inline constexpr int kInterruptSignals[] = {SIGINT, SIGTERM, SIGHUP};
inline constexpr size_t kInterruptSignalCount = sizeof kInterruptSignals / sizeof(int);

/// The interrupt signals as a set.
sigset_t interruptSignalSet();

/// For its lifetime `handler` (with `flags`, and the other interrupt
/// signals held back while it runs) takes each interrupt signal whose action
/// was the default; the others stay as they were.
class InterruptHandlers {
 public:
  InterruptHandlers(void (*handler)(int), int flags);
  ~InterruptHandlers();
  InterruptHandlers(const InterruptHandlers&) = delete;
  InterruptHandlers& operator=(const InterruptHandlers&) = delete;

 private:
  struct sigaction old_[kInterruptSignalCount];
  bool installed_[kInterruptSignalCount] = {};
};

}  // namespace cvn

#endif  // CVN_COLLECT_INTERRUPT_SIGNALS_H_
