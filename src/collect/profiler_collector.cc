#include "collect/profiler_collector.h"

#include <algorithm>
#include <optional>

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

constexpr size_t kStepCount = sizeof kSteps / sizeof kSteps[0];
constexpr size_t kExtraCount = sizeof kExtraTypes / sizeof kExtraTypes[0];

// The slowest types on real Macs start first, so that a scan lasts little
// longer than the slowest of them alone.
constexpr std::string_view kSlowFirst[] = {"SPApplicationsDataType", "SPAirPortDataType",
                                           "SPDiscBurningDataType", "SPNVMeDataType",
                                           "SPStorageDataType"};

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

std::string trimProfilerOutput(std::string output, ProfilerCollector::Trim trim) {
  const size_t head = kProfilerHeader.size();
  const size_t foot = kProfilerFooter.size();
  // Trimmed in place: the applications' output can be most of the document,
  // and a trimmed copy would hold it twice.
  switch (trim) {
    case ProfilerCollector::Trim::kFirst:
      if (output.size() < foot + 1) return std::string();
      output.resize(output.size() - foot);
      return output;
    case ProfilerCollector::Trim::kMiddle:
      if (output.size() < head + foot + 1) return std::string();
      output.resize(output.size() - foot);
      output.erase(0, head);
      return output;
    case ProfilerCollector::Trim::kLast:
      if (output.size() < head + 1) return std::string();
      output.erase(0, head);
      return output;
  }
  return std::string();
}

std::string ProfilerCollector::collect(bool progress, std::FILE* out,
                                       std::vector<size_t>* part_ends,
                                       std::vector<std::string>* extra_documents) {
  // Runs are numbered: the steps first, in their order, then the extra types.
  const size_t run_count = kStepCount + (extra_documents ? kExtraCount : 0);
  auto dataTypeOfRun = [](size_t run) {
    return std::string_view(run < kStepCount ? kSteps[run].data_type
                                             : kExtraTypes[run - kStepCount]);
  };
  std::vector<size_t> start_order;
  for (std::string_view slow : kSlowFirst) {
    for (size_t run = 0; run < run_count; ++run) {
      if (dataTypeOfRun(run) == slow) start_order.push_back(run);
    }
  }
  for (size_t run = 0; run < run_count; ++run) {
    if (std::find(start_order.begin(), start_order.end(), run) == start_order.end())
      start_order.push_back(run);
  }

  const ToolDuration limit = runner_.limits().profiler;
  auto startRun = [&](size_t run) {
    runner_.start(static_cast<int>(run), std::string(kCommand) + std::string(dataTypeOfRun(run)),
                  kProfilerChunk, limit);
  };
  auto noteTimeout = [&](size_t run, const char* outcome) {
    if (!progress) return;
    std::fprintf(out, "%.*s: no answer in %s, %s\n", static_cast<int>(dataTypeOfRun(run).size()),
                 dataTypeOfRun(run).data(), describeLimit(limit).c_str(), outcome);
  };

  std::vector<std::optional<ToolOutput>> results(run_count);
  std::string document;
  if (part_ends) part_ends->clear();
  size_t started = 0;
  size_t running = 0;
  size_t spliced = 0;
  while (started < run_count || running > 0) {
    for (; running < side_by_side_ && started < run_count; ++started, ++running)
      startRun(start_order[started]);
    int id = 0;
    ToolOutput output;
    if (!runner_.waitForOne(&id, &output)) break;
    --running;
    const size_t run = static_cast<size_t>(id);
    if (run >= run_count) continue;
    // Deliberately unbounded for a step that ends having printed nothing:
    // every data type is waited for rather than left out of the inventory.
    // One that hit its limit is never asked again.
    if (run < kStepCount && output.text.empty() && !output.timed_out) {
      startRun(run);
      ++running;
      continue;
    }
    results[run] = std::move(output);

    // Spliced in the fixed order, so the document and the progress lines
    // are what one run at a time would give.
    for (; spliced < kStepCount && results[spliced]; ++spliced) {
      ToolOutput& result = *results[spliced];
      Trim trim = spliced == 0                ? Trim::kFirst
                  : spliced + 1 == kStepCount ? Trim::kLast
                                              : Trim::kMiddle;
      std::string part;
      if (result.timed_out) {
        noteTimeout(spliced, "left out");
      } else {
        part = trimProfilerOutput(std::move(result.text), trim);
      }
      results[spliced].reset();
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
      const char* line = kSteps[spliced].progress;
      if (spliced + 1 == kStepCount) line = "100%\n";
      if (progress && line) {
        std::fputs(line, out);
        std::fflush(out);
      }
    }
  }

  if (extra_documents) {
    extra_documents->clear();
    for (size_t run = kStepCount; run < run_count; ++run) {
      if (!results[run]) continue;
      if (results[run]->timed_out) {
        noteTimeout(run, "left out");
      } else if (!results[run]->text.empty()) {
        extra_documents->push_back(std::move(results[run]->text));
      }
    }
    if (progress) std::fflush(out);
  }
  return document;
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
