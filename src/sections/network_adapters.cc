// The "Network"/"Adapters" section: one record per network service the
// profiler lists, numbered by its place in the profiler's list.
#include <string>

#include "sections/builder_util.h"
#include "sections/sections.h"

namespace cvn {
namespace {

// The elements of a converted array of texts, joined with ", ". An element
// that is not text still gets its separator.
void copyJoinedList(Tag& record, const char* field, const Tag& item, const char* key) {
  const Tag* list = item.findChild(key);
  if (!list || list->properties().empty()) return;
  std::string joined;
  bool first = true;
  for (const auto& element : list->properties()) {
    if (!first) joined += ", ";
    first = false;
    if (element->value().isText()) joined += element->value().text();
  }
  record.setProperty(field, TagValue(std::move(joined)));
}

// "00:1a:2b:3c:4d:5e" in the dash form the rest of the snapshot uses.
std::string toDashedMacAddress(std::string_view address) {
  std::string dashed(address);
  for (char& c : dashed) {
    if (c == ':') {
      c = '-';
    } else if (c >= 'a' && c <= 'z') {
      c = static_cast<char>(c - 'a' + 'A');
    }
  }
  return dashed;
}

}  // namespace

void buildNetworkAdaptersSection(TagTree& snapshot, const TagTree& raw) {
  const Tag* items = findItems(raw, "SPNetworkDataType");
  if (!items || items->children().empty()) return;
  Tag& adapters = snapshot.top().addChild("Network").addChild("Adapters");
  const auto& entries = items->children();
  for (size_t i = 0; i < entries.size(); ++i) {
    const Tag& item = *entries[i];
    const TagValue* name = rawValue(item, "_name");
    Tag& record = adapters.setChildValue(formatText("net-adapter:%zu", itemPosition(item, i) + 1),
                                         name ? *name : TagValue(""));
    copyFieldIfPresent(record, "bsd-device-name", item, "interface");
    copyFieldIfPresent(record, "type", item, "type");
    copyJoinedList(record, "ip-address", item, "ip_address");
    copyJoinedList(record, "ip-subnet", item, "SubnetMasks");
    // Real profilers keep the masks in the IPv4 settings, beside "Router";
    // without this fallback the subnet would never reach the inventory.
    const Tag* ipv4 = item.findChild("IPv4");
    if (!record.findProperty("ip-subnet") && ipv4) {
      copyJoinedList(record, "ip-subnet", *ipv4, "SubnetMasks");
    }
    const Tag* ethernet = item.findChild("Ethernet");
    if (ethernet && hasKey(*ethernet, "MAC_Address")) {
      std::string mac = toDashedMacAddress(rawText(*ethernet, "MAC_Address"));
      record.setProperty("manuf-by-mac", TagValue(mac.substr(0, 8)));
      record.setProperty("mac-address", TagValue(mac));
    }
    if (ipv4) copyFieldIfPresent(record, "default-gateway", *ipv4, "Router");
  }
}

}  // namespace cvn
