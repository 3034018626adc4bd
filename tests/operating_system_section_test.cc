#include "sections/operating_system.h"

#include <gtest/gtest.h>

#include <string>

namespace cvn {
namespace {

TEST(OsVersionTest, SplitsTheProfilerText) {
  // name (null: the whole text), then "version|update|major.minor".
  const char* const cases[][3] = {
      {"Mac OS X Server 10.6.8", "Mac OS X v10.6 (Snow Leopard)", "10.6.8|Update 8|10.6"},
      {"Mac OS X 10.6.0 (10A432)", "Mac OS X v10.6 (Snow Leopard)", "10.6.0 (10A432)||10.6"},
      {"OS X 10.10 (14A389)", nullptr, "10.10 (14A389)||10.10"},
      {"Mac OS X 10.x", "Mac OS X v10.0 (Cheetah)", "10.x||10.0"},
      {"Mac OS X 10.1.08", "Mac OS X v10.1 (Puma)", "10.1.08|Update 8|10.1"},
      {"Mac OS X 10.5.99999999999", "Mac OS X v10.5 (Leopard)", "10.5.99999999999||10.5"},
      {"Mac OS X 10.5.123456789", "Mac OS X v10.5 (Leopard)",
       "10.5.123456789|Update 123456789|10.5"},
      {"macOS 11.2.3 (20D91)", nullptr, "11.2.3 (20D91)|Update 3|11.2"},
      {"", nullptr, "||-1.-1"},
      {"OS X 10.99999999999999999999", nullptr, "10.99999999999999999999||10.999999999"},
      {"OS X 10.950000000", nullptr, "10.950000000||10.950000000"},
      // Read as atoi would: blanks and a sign before the digits.
      {"Mac OS X 10.\t\n\r\v\f +7.1", "Mac OS X v10.7 (Lion)", "10.\t\n\r\v\f +7.1||10.7"},
      {"Mac OS X 10.-7", nullptr, "10.-7||10.-7"},
  };
  for (const auto& c : cases) {
    OsVersionText os = parseOsVersion(c[0]);
    std::string numbers = std::to_string(os.major) + "." + std::to_string(os.minor);
    EXPECT_EQ(os.name, c[1] ? c[1] : c[0]) << c[0];
    EXPECT_EQ(os.version + "|" + os.update + "|" + numbers, c[2]);
  }
}

// Seconds carry into the next field; a fifth field is ignored; the first
// character is never read, nor anything before the last blank; digits
// beyond a field's ninth are dropped.
TEST(OsVersionTest, UptimeBecomesADmtfInterval) {
  const char* const cases[][2] = {{"up 1:02:03:04", "00000001020304.000000:000"},
                                  {"", "00000000000000.000000:000"},
                                  {"up 0:0:59:60", "00000000010000.000000:000"},
                                  {"up 9:1:02:03:04", "00000001020304.000000:000"},
                                  {"1:02:03:04", "00000000020304.000000:000"},
                                  {"up 12345678901:0:0:0", "345678901000000.000000:000"},
                                  {"12 up 3:04", "00000000000304.000000:000"}};
  for (const auto& c : cases) EXPECT_EQ(formatDmtfInterval(uptimeSeconds(c[0])), c[1]) << c[0];
}

}  // namespace
}  // namespace cvn
