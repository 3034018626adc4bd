// Last words of a failing run: one line appended to "panic.log" in the
// working directory and a short report on stderr.
#ifndef CVN_MAIN_PANIC_LOG_H_
#define CVN_MAIN_PANIC_LOG_H_

namespace cvn {

class PanicLog {
 public:
  /// Records the failure in both places; a log file that cannot be opened is
  /// skipped silently. Does not exit. A null `message` is written as empty
  /// text. Returns what the stderr write returns.
  static int reportPanic(const char* file, long line, int code, int errnum, const char* message);
};

}  // namespace cvn

#endif  // CVN_MAIN_PANIC_LOG_H_
