#include "collect/process_group_runner.h"

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/select.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>

extern char** environ;

namespace cvn {
namespace {

// A tool that has closed its output is usually gone a moment later; until it
// is, look again this often.
constexpr auto kExitPoll = std::chrono::milliseconds(10);
// A process that SIGKILL has not ended is stuck in the kernel (a dead network
// volume does that); it is left behind rather than waited for.
constexpr auto kAbandonAfterKill = std::chrono::seconds(2);

void closeFd(int& fd) {
  if (fd >= 0) ::close(fd);
  fd = -1;
}

// Above the standard three, dup2 onto stdout in the child always clears
// close-on-exec; it would keep it if the pipe were already descriptor 1.
int aboveStandardStreams(int fd) {
  if (fd > STDERR_FILENO) return fd;
  int moved = ::fcntl(fd, F_DUPFD, STDERR_FILENO + 1);
  ::close(fd);
  return moved;
}

// Both ends close on exec, so a tool started later never holds another
// tool's pipe open (its reader would then wait for that tool too).
bool makePipe(int fds[2]) {
  if (::pipe(fds) != 0) return false;
  fds[0] = aboveStandardStreams(fds[0]);
  fds[1] = aboveStandardStreams(fds[1]);
  bool ok = fds[0] >= 0 && fds[1] >= 0 && fds[0] < FD_SETSIZE &&
            ::fcntl(fds[0], F_SETFD, FD_CLOEXEC) == 0 &&
            ::fcntl(fds[1], F_SETFD, FD_CLOEXEC) == 0 && ::fcntl(fds[0], F_SETFL, O_NONBLOCK) == 0;
  if (!ok) {
    closeFd(fds[0]);
    closeFd(fds[1]);
  }
  return ok;
}

// True once the leader has ended, without reaping it: while its zombie
// holds the pid, the group's id cannot be handed to anyone else.
bool hasEnded(pid_t pid) {
  for (;;) {
    siginfo_t info;
    std::memset(&info, 0, sizeof info);
    if (::waitid(P_PID, static_cast<id_t>(pid), &info, WEXITED | WNOHANG | WNOWAIT) == 0)
      return info.si_pid == pid;
    if (errno != EINTR) return true;  // already reaped (SIGCHLD ignored)
  }
}

void reap(pid_t pid) {
  int status = 0;
  while (::waitpid(pid, &status, 0) < 0 && errno == EINTR) {
  }
}

}  // namespace

struct ProcessGroupRunner::Child {
  int id = 0;
  pid_t pid = -1;  // the leader's, and so the group's
  int fd = -1;     // closed at the end of the output or at the deadline
  size_t chunk_size = 1;
  Clock::time_point deadline;
  Clock::time_point kill_at;
  Clock::time_point give_up_at;
  bool term_sent = false;
  bool kill_sent = false;
  ToolOutput output;
};

ProcessGroupRunner::ProcessGroupRunner(ToolDuration grace) : grace_(grace) {}

ProcessGroupRunner::~ProcessGroupRunner() {
  for (auto& child : running_) {
    closeFd(child->fd);
    ::kill(-child->pid, SIGKILL);
    if (hasEnded(child->pid)) reap(child->pid);
  }
}

void ProcessGroupRunner::start(int id, const std::string& command, size_t chunk_size,
                               ToolDuration limit) {
  if (!watch_) watch_.emplace();
  int fds[2];
  if (!makePipe(fds)) {
    finished_.emplace_back(id, ToolOutput{});
    return;
  }
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_adddup2(&actions, fds[1], STDOUT_FILENO);
  // Nobody is there to answer a tool that asks a question.
  posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
  posix_spawnattr_t attributes;
  posix_spawnattr_init(&attributes);
  posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETPGROUP | POSIX_SPAWN_SETSIGMASK);
  posix_spawnattr_setpgroup(&attributes, 0);
  posix_spawnattr_setsigmask(&attributes, &watch_->waitMask());
  const char* argv[] = {"sh", "-c", command.c_str(), nullptr};
  pid_t pid = -1;
  int spawned = ::posix_spawn(&pid, "/bin/sh", &actions, &attributes,
                              const_cast<char* const*>(argv), environ);
  posix_spawnattr_destroy(&attributes);
  posix_spawn_file_actions_destroy(&actions);
  ::close(fds[1]);
  if (spawned != 0) {
    ::close(fds[0]);
    finished_.emplace_back(id, ToolOutput{});
    return;
  }
  auto child = std::make_unique<Child>();
  child->id = id;
  child->pid = pid;
  child->fd = fds[0];
  child->chunk_size = chunk_size == 0 ? 1 : chunk_size;
  child->deadline = Clock::now() + limit;
  running_.push_back(std::move(child));
}

bool ProcessGroupRunner::waitForOne(int* id, ToolOutput* output) {
  for (;;) {
    if (!finished_.empty()) {
      *id = finished_.front().first;
      *output = std::move(finished_.front().second);
      finished_.pop_front();
      if (running_.empty() && finished_.empty()) watch_.reset();
      return true;
    }
    if (running_.empty()) {
      watch_.reset();
      return false;
    }
    Clock::time_point now = Clock::now();
    for (size_t i = 0; i < running_.size();) {
      if (advance(*running_[i], now)) {
        finish(i);
      } else {
        ++i;
      }
    }
    if (!finished_.empty()) continue;
    waitForReadable(nextWake(now));
    if (int signal_number = watch_->caught()) endEverythingAndRaise(signal_number);
  }
}

pid_t ProcessGroupRunner::groupOf(int id) const {
  for (const auto& child : running_) {
    if (child->id == id) return child->pid;
  }
  return -1;
}

void ProcessGroupRunner::readAvailable(Child& child) {
  std::string& text = child.output.text;
  for (;;) {
    const size_t had = text.size();
    text.resize(had + child.chunk_size);
    ssize_t got = ::read(child.fd, &text[had], child.chunk_size);
    text.resize(had + (got > 0 ? static_cast<size_t>(got) : 0));
    if (got > 0) continue;
    if (got < 0 && errno == EINTR) continue;
    if (got < 0 && (errno == EAGAIN || errno == EWOULDBLOCK)) return;
    closeFd(child.fd);  // the end of the output, or a pipe that broke
    return;
  }
}

bool ProcessGroupRunner::advance(Child& child, Clock::time_point now) {
  if (!child.term_sent && now >= child.deadline) {
    // What it prints from here on is not waited for.
    closeFd(child.fd);
    child.output.timed_out = true;
    ::kill(-child.pid, SIGTERM);
    child.term_sent = true;
    child.kill_at = now + grace_;
  }
  if (child.term_sent && !child.kill_sent && now >= child.kill_at) {
    ::kill(-child.pid, SIGKILL);
    child.kill_sent = true;
    child.give_up_at = now + kAbandonAfterKill;
  }
  if (child.fd >= 0) return false;
  if (hasEnded(child.pid)) {
    // Whatever of its group is still alive was started by the tool, and
    // would outlive it: one that ignores SIGTERM, or a helper left behind.
    ::kill(-child.pid, SIGKILL);
    reap(child.pid);
    return true;
  }
  return child.kill_sent && now >= child.give_up_at;
}

ProcessGroupRunner::Clock::time_point ProcessGroupRunner::nextWake(Clock::time_point now) const {
  Clock::time_point wake = Clock::time_point::max();
  for (const auto& child : running_) {
    if (!child->term_sent) {
      wake = std::min(wake, child->deadline);
    } else if (!child->kill_sent) {
      wake = std::min(wake, child->kill_at);
    } else {
      wake = std::min(wake, child->give_up_at);
    }
    if (child->fd < 0) wake = std::min(wake, now + kExitPoll);
  }
  return wake;
}

void ProcessGroupRunner::waitForReadable(Clock::time_point until) {
  fd_set readable;
  FD_ZERO(&readable);
  int top = -1;
  for (const auto& child : running_) {
    if (child->fd < 0) continue;
    FD_SET(child->fd, &readable);
    top = std::max(top, child->fd);
  }
  auto left = std::chrono::duration_cast<std::chrono::nanoseconds>(until - Clock::now());
  left = std::max(left, std::chrono::nanoseconds(0));
  left = std::min<std::chrono::nanoseconds>(left, std::chrono::hours(1));
  timespec timeout;
  timeout.tv_sec = static_cast<time_t>(left.count() / 1000000000);
  timeout.tv_nsec = static_cast<long>(left.count() % 1000000000);
  // The watched signals get through only here, so none is missed between a
  // look at the flag and the wait.
  if (::pselect(top + 1, &readable, nullptr, nullptr, &timeout, &watch_->waitMask()) <= 0) return;
  for (auto& child : running_) {
    if (child->fd >= 0 && FD_ISSET(child->fd, &readable)) readAvailable(*child);
  }
}

void ProcessGroupRunner::endEverythingAndRaise(int signal_number) {
  Clock::time_point now = Clock::now();
  for (auto& child : running_) child->deadline = std::min(child->deadline, now);
  watch_->forget();
  while (!running_.empty()) {
    now = Clock::now();
    for (size_t i = 0; i < running_.size();) {
      if (advance(*running_[i], now)) {
        running_.erase(running_.begin() + static_cast<std::ptrdiff_t>(i));
      } else {
        ++i;
      }
    }
    if (running_.empty()) break;
    waitForReadable(nextWake(now));
    // Asked twice: no more grace.
    if (watch_->caught()) {
      for (auto& child : running_) child->kill_at = std::min(child->kill_at, Clock::now());
    }
  }
  finished_.clear();
  watch_.reset();
  ::raise(signal_number);
  std::_Exit(128 + signal_number);
}

void ProcessGroupRunner::finish(size_t index) {
  Child& child = *running_[index];
  finished_.emplace_back(child.id, std::move(child.output));
  running_.erase(running_.begin() + static_cast<std::ptrdiff_t>(index));
}

}  // namespace cvn
