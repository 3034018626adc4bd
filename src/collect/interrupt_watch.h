// While tools run, a Ctrl-C, a kill or a closed SSH session must not leave
// them behind: their process groups are not the agent's, so nothing else
// would stop them.
#ifndef CVN_COLLECT_INTERRUPT_WATCH_H_
#define CVN_COLLECT_INTERRUPT_WATCH_H_

#include <csignal>
#include <optional>

#include "collect/interrupt_signals.h"

namespace cvn {

/// For its lifetime SIGINT, SIGTERM and SIGHUP are held back, except inside
/// a wait that passes waitMask(), where one that arrives is noted instead of
/// ending the process. A signal someone chose to ignore stays ignored. One
/// at a time.
class InterruptWatch {
 public:
  InterruptWatch();
  /// Puts the handlers and the mask back; a signal still held back then
  /// takes its usual course.
  ~InterruptWatch();
  InterruptWatch(const InterruptWatch&) = delete;
  InterruptWatch& operator=(const InterruptWatch&) = delete;

  /// The mask from before the watch: for waiting, and for the tools started.
  const sigset_t& waitMask() const { return old_mask_; }
  /// The signal that arrived, or 0.
  int caught() const;
  /// Notes nothing more until another signal arrives.
  void forget();

 private:
  sigset_t old_mask_;
  std::optional<InterruptHandlers> handlers_;
};

}  // namespace cvn

#endif  // CVN_COLLECT_INTERRUPT_WATCH_H_
