#include "collect/profiler_collector.h"

#include "collect/plist.h"

namespace cvn {

const std::string_view kProfilerHeader =
    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
    "<!DOCTYPE plist PUBLIC \"-//Apple//DTD PLIST 1.0//EN\" "
    "\"http://www.apple.com/DTDs/PropertyList-1.0.dtd\">\n"
    "<plist version=\"1.0\">\n"
    "<array>\n";
const std::string_view kProfilerFooter = "</array>\n</plist>\n";

namespace {

constexpr size_t kProfilerChunk = 65536;

struct Step {
  const char* data_type;
  const char* progress;  // printed after the step, or null
};

// The order is fixed: the first type keeps the document header, the last
// one the footer.
constexpr Step kSteps[] = {
    {"SPHardwareDataType", nullptr},      {"SPNetworkDataType", "10%\n"},
    {"SPSoftwareDataType", nullptr},      {"SPParallelATADataType", "20%\n"},
    {"SPAudioDataType", nullptr},         {"SPBluetoothDataType", "30%\n"},
    {"SPFireWireDataType", nullptr},      {"SPDisplaysDataType", "40%\n"},
    {"SPMemoryDataType", nullptr},        {"SPPrintersDataType", "50%\n"},
    {"SPSerialATADataType", nullptr},     {"SPParallelSCSIDataType", nullptr},
    {"SPUSBDataType", "60%\n"},           {"SPAirPortDataType", nullptr},
    {"SPFirewallDataType", "70%\n"},      {"SPNetworkLocationDataType", nullptr},
    {"SPNetworkVolumeDataType", "80%\n"}, {"SPApplicationsDataType", nullptr},
    {"SPStartupItemDataType", "90%\n"},   {"SPDiscBurningDataType", nullptr},
    {"SPPowerDataType", nullptr},
};

// Types the older Macs do not have; a Mac without them scans as before.
constexpr const char* kExtraTypes[] = {"SPNVMeDataType", "SPStorageDataType", "SPUSBHostDataType"};

constexpr std::string_view kCommand = "system_profiler -detailLevel full -xml ";

bool isExtraType(std::string_view data_type) {
  for (std::string_view extra : kExtraTypes) {
    if (data_type == extra) return true;
  }
  return false;
}

std::string_view dataTypeOf(const PlistValue& element) {
  return element.findText("_dataType").value_or(std::string_view());
}

bool holdsDataType(const PlistValue& root, std::string_view data_type) {
  for (const PlistValue& element : root.items()) {
    if (dataTypeOf(element) == data_type) return true;
  }
  return false;
}

}  // namespace

std::string ProfilerCollector::runProfiler(std::string_view data_type, Trim trim) {
  std::string command(kCommand);
  command += data_type;
  std::string output;
  // Deliberately unbounded: every data type is waited for rather than left
  // out of the inventory.
  do {
    output = runner_.run(command, kProfilerChunk);
  } while (output.empty());

  const size_t head = kProfilerHeader.size();
  const size_t foot = kProfilerFooter.size();
  switch (trim) {
    case Trim::kFirst:
      if (output.size() < foot + 1) return std::string();
      output.resize(output.size() - foot);
      return output;
    // Trimmed in place: the applications' output can be most of the
    // document, and a trimmed copy would hold it twice.
    case Trim::kMiddle:
      if (output.size() < head + foot + 1) return std::string();
      output.resize(output.size() - foot);
      output.erase(0, head);
      return output;
    case Trim::kLast:
      if (output.size() < head + 1) return std::string();
      output.erase(0, head);
      return output;
  }
  return std::string();
}

std::string ProfilerCollector::collect(bool progress, std::FILE* out,
                                       std::vector<size_t>* part_ends) {
  std::string document;
  if (part_ends) part_ends->clear();
  constexpr size_t kStepCount = sizeof kSteps / sizeof kSteps[0];
  for (size_t i = 0; i < kStepCount; ++i) {
    const Step& step = kSteps[i];
    Trim trim = i == 0 ? Trim::kFirst : i + 1 == kStepCount ? Trim::kLast : Trim::kMiddle;
    std::string part = runProfiler(step.data_type, trim);
    if (!part.empty()) {
      document += part;
    } else if (trim == Trim::kFirst) {
      document += kProfilerHeader;
    } else if (trim == Trim::kLast) {
      document += kProfilerFooter;
    }
    if (part_ends && (!part_ends->empty() ? part_ends->back() : 0) != document.size()) {
      part_ends->push_back(document.size());
    }
    if (progress && step.progress) {
      std::fputs(step.progress, out);
      std::fflush(out);
    }
  }
  if (progress) {
    std::fputs("100%\n", out);
    std::fflush(out);
  }
  return document;
}

std::vector<std::string> ProfilerCollector::collectExtraTypes() {
  std::vector<std::string> documents;
  for (const char* data_type : kExtraTypes) {
    // One run only: unlike the main types, a Mac that lacks these is normal,
    // and waiting for them would never end.
    std::string output = runner_.run(std::string(kCommand) + data_type, kProfilerChunk);
    if (!output.empty()) documents.push_back(std::move(output));
  }
  return documents;
}

void addExtraTypes(const std::vector<std::string>& documents, Plist* root) {
  for (const std::string& document : documents) {
    Plist list;
    if (!parsePlist(document, &list) || !list.isArray()) continue;
    std::vector<const PlistValue*> taken;
    for (const PlistValue& element : list.items()) {
      std::string_view data_type = dataTypeOf(element);
      if (!element.isDictionary() || !isExtraType(data_type)) continue;
      // A main document that could not be read at all holds nothing.
      if (root->isArray() && holdsDataType(*root, data_type)) continue;
      bool repeated = false;
      for (const PlistValue* other : taken) repeated = repeated || dataTypeOf(*other) == data_type;
      if (!repeated) taken.push_back(&element);
    }
    if (!taken.empty()) root->appendItems(taken, std::move(list));
  }
}

bool parseCollectedDocument(std::string_view document, const std::vector<size_t>& part_ends,
                            Plist* out, std::string* warning) {
  std::string problem;
  bool read = parsePlist(document, out, &problem);
  if (warning) *warning = problem;
  if (problem.empty() || part_ends.size() < 2) return read;

  Plist merged;
  size_t start = 0;
  for (size_t i = 0; i < part_ends.size(); ++i) {
    size_t end = part_ends[i] < document.size() ? part_ends[i] : document.size();
    if (end <= start) continue;
    // The first piece carries the header, the last the footer; the others
    // get both back.
    std::string piece;
    if (i != 0) piece += kProfilerHeader;
    piece += document.substr(start, end - start);
    if (i + 1 != part_ends.size()) piece += kProfilerFooter;
    start = end;
    Plist value;
    if (!parsePlist(piece, &value) || !value.isArray()) continue;
    std::vector<const PlistValue*> elements;
    for (const PlistValue& element : value.items()) elements.push_back(&element);
    merged.appendItems(elements, std::move(value));
  }
  if (merged.items().empty()) return read;
  *out = std::move(merged);
  return true;
}

}  // namespace cvn
