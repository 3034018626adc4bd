#include "zxml/date_text.h"

#include <cstdio>
#include <cstdlib>
#include <ctime>

namespace cvn {

std::string formatLocalDate(int64_t seconds, bool long_form) {
  // localtime_r need not look at TZ again; a zone changed since the last
  // tzset() would otherwise be ignored.
  tzset();
  return formatLocalDateInCurrentZone(seconds, long_form);
}

std::string formatLocalDateInCurrentZone(int64_t seconds, bool long_form) {
  time_t t = static_cast<time_t>(seconds);
  if (static_cast<int64_t>(t) != seconds) return std::string();
  struct tm local;
  if (!localtime_r(&t, &local)) return std::string();
  char buf[96];
  long long year = static_cast<long long>(local.tm_year) + 1900;
  if (!long_form) {
    std::snprintf(buf, sizeof buf, "%04lld-%02d-%02d", year, local.tm_mon + 1, local.tm_mday);
    return buf;
  }
  // The zone is formatted as sign and hhmm first and then folded into whole
  // minutes; seconds of historic local-mean-time offsets are dropped.
  long offset = local.tm_gmtoff;
  char sign = offset < 0 ? '-' : '+';
  unsigned long magnitude = static_cast<unsigned long>(std::labs(offset));
  unsigned hours = static_cast<unsigned>(magnitude / 3600);
  unsigned minutes = static_cast<unsigned>(magnitude % 3600 / 60);
  std::snprintf(buf, sizeof buf, "%04lld%02d%02d%02d%02d%02d.000000%c%u", year, local.tm_mon + 1,
                local.tm_mday, local.tm_hour, local.tm_min, local.tm_sec, sign,
                hours * 60 + minutes);
  return buf;
}

}  // namespace cvn
