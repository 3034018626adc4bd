#include <gtest/gtest.h>

#include <string>

#include "sections/sections.h"
#include "tree_text.h"

namespace cvn {
namespace {

TEST(PrintersSectionTest, PrintersMultifunctionDevicesAndScanners) {
  TagTree raw(true, "Macintosh");
  auto set = [&](int item, const std::string& key, const TagValue& value) {
    raw.setValue("/SPPrintersDataType/_items/item" + std::to_string(item) + "/" + key, value);
  };
  // A multifunction device whose app is only known by its bundle path.
  set(0, "_name", "Office MFP");
  set(0, "default", "yes");
  set(0, "scanner", "yes");
  set(0, "scannerappbundlepath", "/Applications/Image Capture.app");
  // Neither a printer nor a scanner: no record, no number used.
  set(1, "_name", "Stray");
  set(1, "scanner", "Yes");
  set(2, "_name", "Flatbed");
  set(2, "scanner", "yes");
  set(2, "scannerapppath", "/Applications/Scan.app");
  TagTree snapshot(true, "Snapshot");
  buildPrintersSection(snapshot, raw);
  EXPECT_EQ(treeText(snapshot.top().findChild("Peripherals")), R"(+Peripherals=
+Printers=
*Printer:1="Office MFP"
~kind=MFP
is-default="1"
status=
scanner-uuid=
scanner-app-path="/Applications/Image Capture.app"
-
+Scanners=
*Scanner:1="Flatbed"
scanner-app-path="/Applications/Scan.app"
-
-
)");
}

}  // namespace
}  // namespace cvn
