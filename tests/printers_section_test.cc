#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

class PrintersSectionTest : public ::testing::Test {
 protected:
  void set(int item, const std::string& key, const TagValue& value) {
    raw_.setValue("/SPPrintersDataType/_items/item" + std::to_string(item) + "/" + key, value);
  }
  std::string build() {
    buildPrintersSection(snapshot_, raw_);
    return treeText(snapshot_.top().findChild("Peripherals"));
  }

  TagTree raw_{true, "Macintosh"};
  TagTree snapshot_{true, "Snapshot"};
};

TEST_F(PrintersSectionTest, PrintersMultifunctionDevicesAndScanners) {
  // A multifunction device whose app is only known by its bundle path.
  set(0, "_name", "Office MFP");
  set(0, "default", "yes");
  set(0, "status", "idle");
  set(0, "scanner", "yes");
  set(0, "scannerUUID", "0A1B");
  set(0, "scannerappbundlepath", "/Applications/Image Capture.app");
  set(0, "fax", "no");
  set(0, "driverversion", "10.6");
  set(0, "uri", "dnssd://Office._ipp._tcp.local./");
  set(0, "ppd", "Office MFP");
  set(0, "ppdfileversion", "1.2");
  // Neither a printer nor a scanner: no record, no number used.
  set(1, "_name", "Stray");
  set(1, "scanner", "Yes");
  // A stand-alone scanner.
  set(2, "_name", "Flatbed");
  set(2, "scanner", "yes");
  set(2, "scannerUUID", "FFEE");
  set(2, "scannerapppath", "/Applications/Scan.app");
  set(2, "scannerappversion", "2.0");
  // A plain printer: not default, no fax key, "no" scanner, nothing else.
  set(3, "_name", "Laser");
  set(3, "default", "no");
  set(3, "scanner", "no");
  set(3, "printserver", "cups.example.com");
  // A scanner reporting nothing else; then a printer with both app paths.
  set(4, "_name", "Handheld");
  set(4, "scanner", "yes");
  set(5, "_name", "Second MFP");
  set(5, "default", "maybe");
  set(5, "scanner", "fax-capable");
  set(5, "scannerapppath", "/Applications/Own.app");
  set(5, "scannerappbundlepath", "/Applications/Other.app");
  set(5, "fax", "yes");

  EXPECT_EQ(build(), R"(+Peripherals=
+Printers=
*Printer:1="Office MFP"
~kind=MFP
is-default="1"
status="idle"
scanner-uuid="0A1B"
scanner-app-path="/Applications/Image Capture.app"
is-fax="0"
driver-version="10.6"
uri="dnssd://Office._ipp._tcp.local./"
ppd="Office MFP"
ppd-file-version="1.2"
*Printer:2="Laser"
is-default="0"
status=
print-server="cups.example.com"
*Printer:3="Second MFP"
~kind=MFP
is-default="1"
status=
scanner-uuid=
scanner-app-path="/Applications/Own.app"
is-fax="1"
-
+Scanners=
*Scanner:1="Flatbed"
scanner-uuid="FFEE"
scanner-app-path="/Applications/Scan.app"
scanner-app-version="2.0"
*Scanner:2="Handheld"
-
-
)");
}

TEST_F(PrintersSectionTest, NoRecordsNoSection) {
  set(0, "_name", "Stray");
  EXPECT_EQ(build(), "");
}

}  // namespace
}  // namespace cvn
