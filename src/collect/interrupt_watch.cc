#include "collect/interrupt_watch.h"

#include <cstring>

namespace cvn {
namespace {

constexpr int kWatchedSignals[] = {SIGINT, SIGTERM, SIGHUP};

volatile sig_atomic_t caught_signal = 0;

extern "C" void noteSignal(int signal_number) { caught_signal = signal_number; }

}  // namespace

InterruptWatch::InterruptWatch() {
  caught_signal = 0;
  sigset_t watched;
  sigemptyset(&watched);
  for (int s : kWatchedSignals) sigaddset(&watched, s);
  sigprocmask(SIG_BLOCK, &watched, &old_mask_);

  struct sigaction action;
  std::memset(&action, 0, sizeof action);
  action.sa_handler = noteSignal;
  sigemptyset(&action.sa_mask);
  for (size_t i = 0; i < 3; ++i) {
    // An ignored signal (nohup's SIGHUP) stays ignored, and a handler someone
    // else installed stays theirs.
    installed_[i] = sigaction(kWatchedSignals[i], nullptr, &old_actions_[i]) == 0 &&
                    old_actions_[i].sa_handler == SIG_DFL &&
                    sigaction(kWatchedSignals[i], &action, nullptr) == 0;
  }
}

InterruptWatch::~InterruptWatch() {
  for (size_t i = 0; i < 3; ++i) {
    if (installed_[i]) sigaction(kWatchedSignals[i], &old_actions_[i], nullptr);
  }
  // Handlers first: a signal that arrived while held back now ends the
  // process as it would have without the watch.
  sigprocmask(SIG_SETMASK, &old_mask_, nullptr);
}

int InterruptWatch::caught() const { return caught_signal; }

void InterruptWatch::forget() { caught_signal = 0; }

}  // namespace cvn
