#include "collect/interrupt_watch.h"

namespace cvn {
namespace {

volatile sig_atomic_t caught_signal = 0;

extern "C" void noteSignal(int signal_number) { caught_signal = signal_number; }

}  // namespace

InterruptWatch::InterruptWatch() {
  caught_signal = 0;
  sigset_t watched = interruptSignalSet();
  sigprocmask(SIG_BLOCK, &watched, &old_mask_);
  handlers_.emplace(noteSignal, 0);
}

InterruptWatch::~InterruptWatch() {
  // Handlers first: a signal that arrived while held back then ends the
  // process as it would have without the watch.
  handlers_.reset();
  sigprocmask(SIG_SETMASK, &old_mask_, nullptr);
}

int InterruptWatch::caught() const { return caught_signal; }

void InterruptWatch::forget() { caught_signal = 0; }

}  // namespace cvn
