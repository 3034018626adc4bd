// Runs one command and tells what it cost by itself: wall time, the CPU
// time of that process alone (not of the tools it starts), the CPU time of
// the children it waited for, and its peak resident memory. Shell timing
// and /usr/bin/time add the children's time in, which is exactly what the
// scan-cost benchmark has to keep apart. The process is read in /proc after
// it has exited but before it is reaped, the one moment when its own time is
// final and still separate. Linux only; used by bench/scan_cost.sh.
//
//   run_measured SECONDS REPORT_FILE COMMAND [ARGUMENT...]
//
// The command gets SECONDS to finish; then, or when this program is told to
// stop, it and everything in its process group are killed. REPORT_FILE receives one line:
//   wall_s=W own_cpu_s=C children_cpu_s=K max_rss_kb=M status=S
// where S is the exit status, or "killed" / "signal-N".
#include <signal.h>
#include <sys/resource.h>
#include <sys/time.h>
#include <sys/types.h>
#include <sys/wait.h>
#include <time.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <sstream>
#include <string>

namespace {

volatile sig_atomic_t g_stop = 0;

// A timeout, or the caller giving up: either way the command has to go.
void onStop(int) { g_stop = 1; }

double secondsSince(const timespec& start) {
  timespec now;
  clock_gettime(CLOCK_MONOTONIC, &now);
  return static_cast<double>(now.tv_sec - start.tv_sec) +
         static_cast<double>(now.tv_nsec - start.tv_nsec) / 1e9;
}

std::string readFile(const std::string& path) {
  std::ifstream in(path);
  std::stringstream text;
  text << in.rdbuf();
  return text.str();
}

// Fields 14 to 17 of /proc/PID/stat (utime, stime, cutime, cstime) in
// clock ticks; the name in field 2 may hold blanks, so counting starts after
// its closing parenthesis.
bool readTicks(pid_t pid, long long ticks[4]) {
  std::string stat = readFile("/proc/" + std::to_string(pid) + "/stat");
  size_t close = stat.rfind(')');
  if (close == std::string::npos) return false;
  std::istringstream fields(stat.substr(close + 1));
  std::string field;
  // Field 3 (the state) is the first after the name; field 14 is the 12th.
  for (int i = 3; i < 14; ++i) fields >> field;
  for (int i = 0; i < 4; ++i) fields >> ticks[i];
  return static_cast<bool>(fields);
}

// Nanoseconds on the CPU from the scheduler: finer than the 10 ms ticks,
// which matter for a scan that takes tens of milliseconds.
bool readRunNanoseconds(pid_t pid, long long* ns) {
  std::istringstream in(readFile("/proc/" + std::to_string(pid) + "/schedstat"));
  return static_cast<bool>(in >> *ns) && *ns > 0;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc < 4) {
    std::fprintf(stderr, "usage: run_measured SECONDS REPORT_FILE COMMAND [ARGUMENT...]\n");
    return 2;
  }
  int limit = std::atoi(argv[1]);
  if (limit <= 0) limit = 600;
  const char* report_path = argv[2];

  // The command runs in a process group of its own, out of reach of the
  // signals that stop our caller; they are passed on.
  struct sigaction stop_action;
  std::memset(&stop_action, 0, sizeof stop_action);
  stop_action.sa_handler = onStop;  // no SA_RESTART: the wait must return
  for (int signal : {SIGALRM, SIGTERM, SIGINT, SIGHUP}) sigaction(signal, &stop_action, nullptr);

  timespec start;
  clock_gettime(CLOCK_MONOTONIC, &start);
  pid_t pid = fork();
  if (pid < 0) {
    std::perror("run_measured: fork");
    return 2;
  }
  if (pid == 0) {
    setpgid(0, 0);  // one group, so a timeout takes the tools along
    execvp(argv[3], argv + 3);
    std::perror("run_measured: exec");
    _exit(127);
  }
  setpgid(pid, pid);
  alarm(static_cast<unsigned>(limit));

  siginfo_t info;
  std::memset(&info, 0, sizeof info);
  bool killed = false;
  for (;;) {
    if (waitid(P_PID, static_cast<id_t>(pid), &info, WEXITED | WNOWAIT) == 0) break;
    if (errno != EINTR) {
      std::perror("run_measured: waitid");
      return 2;
    }
    if (g_stop && !killed) {
      kill(-pid, SIGKILL);
      kill(pid, SIGKILL);
      killed = true;
    }
  }
  alarm(0);
  double wall = secondsSince(start);

  long long ticks[4] = {0, 0, 0, 0};
  bool have_ticks = readTicks(pid, ticks);
  long long own_ns = 0;
  bool have_ns = readRunNanoseconds(pid, &own_ns);
  double tick = static_cast<double>(sysconf(_SC_CLK_TCK));
  double own = have_ns      ? static_cast<double>(own_ns) / 1e9
               : have_ticks ? static_cast<double>(ticks[0] + ticks[1]) / tick
                            : -1.0;
  double children = have_ticks ? static_cast<double>(ticks[2] + ticks[3]) / tick : -1.0;

  int status = 0;
  struct rusage usage;
  std::memset(&usage, 0, sizeof usage);
  while (wait4(pid, &status, 0, &usage) < 0 && errno == EINTR) {
  }
  if (killed) kill(-pid, SIGKILL);  // tools the agent left behind

  std::string outcome;
  if (killed) {
    outcome = "killed";
  } else if (WIFEXITED(status)) {
    outcome = std::to_string(WEXITSTATUS(status));
  } else {
    outcome = "signal-" + std::to_string(WTERMSIG(status));
  }
  FILE* report = std::fopen(report_path, "w");
  if (!report) {
    std::perror("run_measured: report");
    return 2;
  }
  // ru_maxrss of a reaped child is the largest of it and its own reaped
  // children; the agent outgrows every tool it starts.
  std::fprintf(report, "wall_s=%.3f own_cpu_s=%.3f children_cpu_s=%.2f max_rss_kb=%ld status=%s\n",
               wall, own, children, usage.ru_maxrss, outcome.c_str());
  std::fclose(report);
  return killed ? 124 : 0;
}
