#include <string>
#include <string_view>

#include "sections/builder_util.h"
#include "sections/sections.h"

namespace cvn {
namespace {

// "0" for exactly "No", "1" for anything else the profiler prints.
TagValue enabledFlag(const Tag& item, std::string_view key) {
  return TagValue(rawText(item, key) == "No" ? "0" : "1");
}

void writeRules(Tag& firewall, std::string_view group_name, const char* record_format,
                const Tag& rules) {
  Tag& group = firewall.addChild(group_name);
  const auto& children = rules.children();
  for (size_t i = 0; i < children.size(); ++i) {
    const Tag& rule = *children[i];
    // Numbered by raw position: entries the converter dropped leave gaps in
    // the item names, not in the record numbers.
    Tag& record = addComplexRecord(group, formatText(record_format, static_cast<int>(i + 1)));
    if (const TagValue* name = rawValue(rule, "_name")) record.setValue(*name);
    bool blocked = rawText(rule, "value") == "spfirewall_block_all";
    record.setProperty("status", TagValue(blocked ? "0" : "1"));
  }
}

void writeFirewall(Tag& firewall, const Tag& item) {
  std::string_view state = rawText(item, "spfirewall_globalstate");
  if (state == "spfirewall_globalstate_limit_connections") {
    firewall.setProperty("status", TagValue("1"));
  } else if (state == "spfirewall_globalstate_block_all") {
    firewall.setProperty("status", TagValue("2"));
  } else if (state == "spfirewall_globalstate_allow_all") {
    firewall.setProperty("status", TagValue("0"));
  }
  if (const Tag* services = item.findChild("spfirewall_services"))
    writeRules(firewall, "Services", "service:%d", *services);
  if (const Tag* apps = item.findChild("spfirewall_applications"))
    writeRules(firewall, "Apps", "app:%d", *apps);
  if (hasKey(item, "spfirewall_stealthenabled"))
    firewall.setProperty("stealth-mode", enabledFlag(item, "spfirewall_stealthenabled"));
  if (hasKey(item, "spfirewall_loggingenabled"))
    firewall.setProperty("fw-log", enabledFlag(item, "spfirewall_loggingenabled"));
}

}  // namespace

void buildFirewallSection(TagTree& snapshot, const TagTree& raw) {
  const Tag* items = findItems(raw, "SPFirewallDataType");
  if (!items) return;
  for (const auto& item : items->children()) {
    Tag& firewall = snapshot.top().addChild("Security").addChild("Firewall");
    writeFirewall(firewall, *item);
  }
}

}  // namespace cvn
