#include "collect/interrupt_signals.h"

#include <cstring>

namespace cvn {

sigset_t interruptSignalSet() {
  sigset_t set;
  sigemptyset(&set);
  for (int s : kInterruptSignals) sigaddset(&set, s);
  return set;
}

InterruptHandlers::InterruptHandlers(void (*handler)(int), int flags) {
  struct sigaction action;
  std::memset(&action, 0, sizeof action);
  action.sa_handler = handler;
  action.sa_mask = interruptSignalSet();
  action.sa_flags = flags;
  for (size_t i = 0; i < kInterruptSignalCount; ++i) {
    installed_[i] = sigaction(kInterruptSignals[i], nullptr, &old_[i]) == 0 &&
                    old_[i].sa_handler == SIG_DFL &&
                    sigaction(kInterruptSignals[i], &action, nullptr) == 0;
  }
}

InterruptHandlers::~InterruptHandlers() {
  for (size_t i = 0; i < kInterruptSignalCount; ++i)
    if (installed_[i]) sigaction(kInterruptSignals[i], &old_[i], nullptr);
}

}  // namespace cvn
