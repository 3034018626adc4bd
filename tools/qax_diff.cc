#include "qax_diff.h"

#include <algorithm>
#include <string_view>
#include <unordered_map>

#include "record_match.h"

namespace cvn {

namespace {

using Kind = QaxChange::Kind;
using Subject = QaxChange::Subject;

const std::vector<QaxNode> kNoNodes;
const std::vector<QaxProperty> kNoProperties;

// Groups hold records: the top tag, the sections and the groups under them
// ("Peripherals/USB"). Records carry a colon in their name ("Memory-slot:1",
// "Soft:Safari 5.1") or are leaves ("General-info").
bool isGroup(const QaxNode& node) {
  return node.branch && node.name.find(':') == std::string::npos;
}

// The parent's marker of a complex record only repeats the record's name.
bool isComplexMarker(const QaxProperty& property) {
  for (const QaxAnnotation& a : property.annotations)
    if (a.key == "complex") return true;
  return false;
}

std::string_view versionOf(const QaxNode& node) {
  const QaxProperty* version = node.findProperty("version");
  return version ? std::string_view(version->value) : std::string_view();
}

// "Soft:Calculator 4.5.3" without the version the agent appended to it.
std::string_view nameWithoutVersion(const QaxNode& node) {
  std::string_view name = node.name, version = versionOf(node);
  size_t cut = name.size() - std::min(name.size(), version.size() + 1);
  if (!version.empty() && cut > 0 && name[cut] == ' ' && name.substr(cut + 1) == version)
    return name.substr(0, cut);
  return name;
}

// Numbered records ("Device:2") are renumbered when one is plugged in before
// them; what they stand for is their kind and their own value (the device's
// name). Others stand for their name without its version, so that an
// application's upgrade pairs with its old self.
bool identityKey(const QaxNode& node, MatchKey* key) {
  std::string_view name = node.name;
  size_t colon = name.find(':');
  bool numbered = colon != std::string_view::npos && colon + 1 < name.size() &&
                  name.find_first_not_of("0123456789", colon + 1) == std::string_view::npos;
  if (!numbered) {
    *key = {nameWithoutVersion(node), std::string_view()};
    return true;
  }
  if (node.value.empty()) return false;
  *key = {name.substr(0, colon + 1), node.value};
  return true;
}

// Runs of digits compare as numbers, anything else as text: 4.10 is newer
// than 4.9.
int compareVersions(std::string_view a, std::string_view b) {
  size_t i = 0, j = 0;
  auto isDigit = [](char c) { return c >= '0' && c <= '9'; };
  while (i < a.size() && j < b.size()) {
    if (isDigit(a[i]) && isDigit(b[j])) {
      size_t ie = i, je = j;
      while (ie < a.size() && isDigit(a[ie])) ++ie;
      while (je < b.size() && isDigit(b[je])) ++je;
      std::string_view x = a.substr(i, ie - i), y = b.substr(j, je - j);
      x.remove_prefix(std::min(x.find_first_not_of('0'), x.size()));
      y.remove_prefix(std::min(y.find_first_not_of('0'), y.size()));
      if (x.size() != y.size()) return x.size() < y.size() ? -1 : 1;
      if (int c = x.compare(y)) return c;
      i = ie;
      j = je;
    } else if (a[i] != b[j]) {
      return a[i] < b[j] ? -1 : 1;
    } else {
      ++i;
      ++j;
    }
  }
  return (i < a.size()) - (j < b.size());
}

std::string upgradeNote(const QaxNode& old_record, const QaxNode& new_record) {
  std::string_view old_version = versionOf(old_record), new_version = versionOf(new_record);
  std::string_view name = nameWithoutVersion(new_record);
  if (old_version.empty() || new_version.empty() || old_version == new_version ||
      name != nameWithoutVersion(old_record))
    return std::string();
  int order = compareVersions(old_version, new_version);
  const char* verb = order < 0   ? " upgraded from "
                     : order > 0 ? " downgraded from "
                                 : " changed from ";
  name.remove_prefix(std::min(name.find(':') + 1, name.size()));
  return std::string(name) + verb + std::string(old_version) + " to " + std::string(new_version);
}

class TreeDiff {
 public:
  TreeDiff(const QaxDiffOptions& options, std::vector<QaxChange>& out)
      : options_(options), out_(out) {}

  void compareTops(const QaxNode* old_top, const QaxNode* new_top) {
    top_ = (new_top ? new_top : old_top)->name;
    compareGroup(std::string(), old_top, new_top, true);
  }

 private:
  void add(Kind kind, Subject subject, const std::string& section, const std::string& record,
           std::string_view field, std::string_view old_value, std::string_view new_value) {
    QaxChange change;
    change.section = section;
    change.record = record;
    change.kind = kind;
    change.subject = subject;
    change.field = field;
    change.old_value = old_value;
    change.new_value = new_value;
    out_.push_back(std::move(change));
  }

  bool isNoiseGroup(const std::string& path) const {
    if (top_ == "Snapshot") return path == "Processes" || path == "Environment";
    return top_ == "AssetInfo" && path == "control";
  }

  bool isNoiseField(const std::string& section, const std::string& record,
                    std::string_view field) const {
    if (section == top_ && record == top_)
      return field == "timestamp" || field == "scan-time" || field == "first-scan" ||
             field == "last-scan" || field == "snapshot-list";
    if (section == "OS") return field == "uptime";
    return section == "Storage/Logical-disks" && (field == "free" || field == "used%");
  }

  // A group's own fields are named by the group under its parent section.
  void compareGroup(const std::string& parent, const QaxNode* old_group, const QaxNode* new_group,
                    bool top) {
    const QaxNode& group = new_group ? *new_group : *old_group;
    std::string path = top              ? std::string()
                       : parent.empty() ? group.name
                                        : parent + "/" + group.name;
    if (!options_.all && isNoiseGroup(path)) return;
    compareFields(parent.empty() ? group.name : parent, group.name, old_group, new_group);
    compareChildren(path, std::string(), old_group, new_group);
  }

  void compareChildren(const std::string& section, const std::string& record_prefix,
                       const QaxNode* old_node, const QaxNode* new_node) {
    const std::vector<QaxNode>& old_children = old_node ? old_node->children : kNoNodes;
    const std::vector<QaxNode>& new_children = new_node ? new_node->children : kNoNodes;
    if (old_children.empty() && new_children.empty()) return;
    ListPairing pairing(old_children.size(), new_children.size());
    auto exact = [](const std::vector<QaxNode>& list) {
      return [&list](size_t i, MatchKey* key) {
        *key = {list[i].name, list[i].value};
        return true;
      };
    };
    auto identity = [](const std::vector<QaxNode>& list) {
      return [&list](size_t i, MatchKey* key) { return identityKey(list[i], key); };
    };
    auto byName = [](const std::vector<QaxNode>& list) {
      return [&list](size_t i, MatchKey* key) {
        *key = {list[i].name, std::string_view()};
        return true;
      };
    };
    pairing.pairBy(exact(old_children), exact(new_children));
    pairing.pairBy(identity(old_children), identity(new_children));
    pairing.pairBy(byName(old_children), byName(new_children));
    for (size_t j = 0; j < new_children.size(); ++j) {
      uint32_t i = pairing.oldOf(j);
      visit(section, record_prefix, i == ListPairing::kNone ? nullptr : &old_children[i],
            &new_children[j]);
    }
    for (size_t i = 0; i < old_children.size(); ++i)
      if (pairing.newOf(i) == ListPairing::kNone)
        visit(section, record_prefix, &old_children[i], nullptr);
  }

  void visit(const std::string& section, const std::string& record_prefix, const QaxNode* old_node,
             const QaxNode* new_node) {
    const QaxNode& node = new_node ? *new_node : *old_node;
    if (record_prefix.empty() && isGroup(node)) {
      compareGroup(section, old_node, new_node, false);
    } else {
      compareRecord(section, record_prefix, old_node, new_node);
    }
  }

  void compareRecord(const std::string& section, const std::string& prefix,
                     const QaxNode* old_record, const QaxNode* new_record) {
    if (!old_record || !new_record) {
      const QaxNode& record = new_record ? *new_record : *old_record;
      Kind kind = new_record ? Kind::kAdded : Kind::kRemoved;
      add(kind, Subject::kRecord, section, prefix + record.name, std::string_view(),
          old_record ? old_record->value : std::string(),
          new_record ? new_record->value : std::string());
      return;
    }
    std::string label = prefix + new_record->name;
    size_t mark = out_.size();
    std::string note;
    if (old_record->name != new_record->name) note = upgradeNote(*old_record, *new_record);
    compareFields(section, label, old_record, new_record);
    compareChildren(section, label + "/", old_record, new_record);
    // A record that was only renumbered is the same record; a renamed one
    // that changed is said to be the old one first.
    if (old_record->name == new_record->name || (note.empty() && out_.size() == mark)) return;
    add(Kind::kChanged, Subject::kRecord, section, label, std::string_view(),
        prefix + old_record->name, label);
    out_.back().note = std::move(note);
    std::rotate(out_.begin() + static_cast<std::ptrdiff_t>(mark), out_.end() - 1, out_.end());
  }

  void compareFields(const std::string& section, const std::string& record, const QaxNode* old_node,
                     const QaxNode* new_node) {
    if (old_node && new_node && old_node->value != new_node->value)
      add(Kind::kChanged, Subject::kValue, section, record, std::string_view(), old_node->value,
          new_node->value);
    const std::vector<QaxProperty>& old_fields = old_node ? old_node->properties : kNoProperties;
    const std::vector<QaxProperty>& new_fields = new_node ? new_node->properties : kNoProperties;
    auto field = [](const std::vector<QaxProperty>& list) {
      return [&list](size_t i, MatchKey* key) {
        *key = {list[i].name, std::string_view()};
        return !isComplexMarker(list[i]);
      };
    };
    ListPairing pairing(old_fields.size(), new_fields.size());
    pairing.pairBy(field(old_fields), field(new_fields));
    auto counts = [&](const QaxProperty& p) {
      return !isComplexMarker(p) && (options_.all || !isNoiseField(section, record, p.name));
    };
    for (size_t j = 0; j < new_fields.size(); ++j) {
      const QaxProperty& now = new_fields[j];
      if (!counts(now)) continue;
      uint32_t i = pairing.oldOf(j);
      if (i == ListPairing::kNone) {
        add(Kind::kAdded, Subject::kField, section, record, now.name, std::string_view(),
            now.value);
      } else if (old_fields[i].value != now.value) {
        add(Kind::kChanged, Subject::kField, section, record, now.name, old_fields[i].value,
            now.value);
      }
    }
    for (size_t i = 0; i < old_fields.size(); ++i) {
      const QaxProperty& was = old_fields[i];
      if (pairing.newOf(i) == ListPairing::kNone && counts(was))
        add(Kind::kRemoved, Subject::kField, section, record, was.name, was.value,
            std::string_view());
    }
  }

  const QaxDiffOptions& options_;
  std::vector<QaxChange>& out_;
  std::string top_;
};

const QaxNode* topOf(const QaxFile& file, std::string_view type) {
  const QaxBlock* block = file.findBlock(type);
  return block && block->kind == QaxBlock::Kind::kTree ? block->tree.top() : nullptr;
}

std::string assetField(const QaxFile& file, std::string_view name) {
  const QaxNode* asset = topOf(file, "assetinfo");
  const QaxProperty* property = asset ? asset->findProperty(name) : nullptr;
  return property ? property->value : std::string();
}

}  // namespace

QaxDiff diffQaxFiles(const QaxFile& old_file, const QaxFile& new_file,
                     const QaxDiffOptions& options) {
  QaxDiff diff;
  for (const char* type : {"snapshot", "assetinfo"}) {
    const QaxNode *old_top = topOf(old_file, type), *new_top = topOf(new_file, type);
    if (old_top || new_top) TreeDiff(options, diff.changes).compareTops(old_top, new_top);
  }
  // A section's changes read together, though the walk can come back to a
  // section after one of its groups.
  std::unordered_map<std::string, size_t> first_seen;
  for (const QaxChange& change : diff.changes)
    first_seen.emplace(change.section, first_seen.size());
  std::stable_sort(diff.changes.begin(), diff.changes.end(),
                   [&first_seen](const QaxChange& a, const QaxChange& b) {
                     return first_seen[a.section] < first_seen[b.section];
                   });
  diff.old_serial = assetField(old_file, "serial-number");
  diff.new_serial = assetField(new_file, "serial-number");
  diff.old_mac = assetField(old_file, "mac-address");
  diff.new_mac = assetField(new_file, "mac-address");
  diff.same_mac = (!diff.old_serial.empty() && diff.old_serial == diff.new_serial) ||
                  (!diff.old_mac.empty() && diff.old_mac == diff.new_mac);
  return diff;
}

}  // namespace cvn
