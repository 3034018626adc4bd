#include "main/panic_log.h"

#include <cstdio>
#include <cstring>
#include <ctime>

namespace cvn {

int PanicLog::reportPanic(const char* file, long line, int code, int errnum, const char* message) {
  if (!file) file = "";
  if (!message) message = "";
  if (FILE* log = std::fopen("panic.log", "a+")) {
    std::fprintf(log,
                 "PANIC EXIT. Application: %s, Time: %lu, File: %s, Line: %lu, Code: #%i, "
                 "Error: #%i (%s), Message: \"%s\"\n",
                 "cvnmacagent", static_cast<unsigned long>(std::time(nullptr)), file,
                 static_cast<unsigned long>(line), code, errnum, std::strerror(errnum), message);
    std::fclose(log);
  }
  return std::fprintf(
      stderr, "Error at Line: %ld;\nErrnum: %d;\nFile name: %s;\nMessage: %s;\n Code: %d;\n", line,
      errnum, file, message, code);
}

}  // namespace cvn
