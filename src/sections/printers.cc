#include <string>
#include <string_view>

#include "sections/builder_util.h"
#include "sections/sections.h"

namespace cvn {
namespace {

// The queue or scanner name as the record's own value, whatever its kind.
Tag& addNamedRecord(Tag& group, const std::string& record_name, const Tag& item) {
  const TagValue* name = rawValue(item, "_name");
  return name ? group.setChildValue(record_name, *name) : group.addChild(record_name);
}

TagValue notNoFlag(const Tag& item, std::string_view key) {
  return TagValue(rawText(item, key) == "no" ? "0" : "1");
}

void writePrinter(Tag& printer, const Tag& item) {
  printer.setProperty("is-default", notNoFlag(item, "default"));
  copyField(printer, "status", item, "status");
  if (hasKey(item, "scanner") && rawText(item, "scanner") != "no") {
    printer.addAnnotation("kind", "MFP");
    copyField(printer, "scanner-uuid", item, "scannerUUID");
    copyField(printer, "scanner-app-path", item,
              hasKey(item, "scannerapppath") ? "scannerapppath" : "scannerappbundlepath");
  }
  if (hasKey(item, "fax")) printer.setProperty("is-fax", notNoFlag(item, "fax"));
  copyFieldIfPresent(printer, "driver-version", item, "driverversion");
  copyFieldIfPresent(printer, "print-server", item, "printserver");
  // An empty field would read as "known to be empty" in the console; a queue
  // that does not report these simply lacks them.
  copyFieldIfPresent(printer, "uri", item, "uri");
  copyFieldIfPresent(printer, "ppd", item, "ppd");
  copyFieldIfPresent(printer, "ppd-file-version", item, "ppdfileversion");
}

void writeScanner(Tag& scanner, const Tag& item) {
  copyFieldIfPresent(scanner, "scanner-uuid", item, "scannerUUID");
  copyFieldIfPresent(scanner, "scanner-app-path", item, "scannerapppath");
  copyFieldIfPresent(scanner, "scanner-app-version", item, "scannerappversion");
}

}  // namespace

void buildPrintersSection(TagTree& snapshot, const TagTree& raw) {
  const Tag* items = findItems(raw, "SPPrintersDataType");
  if (!items) return;
  int printers = 0;
  int scanners = 0;
  for (const auto& entry : items->children()) {
    const Tag& item = *entry;
    if (hasKey(item, "default")) {
      Tag& group = snapshot.top().addChild("Peripherals").addChild("Printers");
      writePrinter(addNamedRecord(group, formatText("Printer:%d", ++printers), item), item);
    } else if (rawText(item, "scanner") == "yes") {
      Tag& group = snapshot.top().addChild("Peripherals").addChild("Scanners");
      writeScanner(addNamedRecord(group, formatText("Scanner:%d", ++scanners), item), item);
    }
  }
}

}  // namespace cvn
