#include "main/post_processor.h"

#include <functional>

#include "sections/sections.h"
#include "sections/written_volumes.h"

namespace cvn {

void postProcess(TagTree& snapshot, const TagTree& raw, const SectionSources& sources,
                 std::FILE* log) {
  CommandRunner& runner = sources.runner;
  FileSystem& files = sources.files;
  std::FILE* out = log;
  WrittenVolumes volumes;  // shared by the disks and the USB media
  const std::function<void()> steps[] = {
      [&] { buildSystemSection(snapshot, raw, sources.ioreg_uuid); },
      [&] { buildProcessorsSection(snapshot, raw); },
      [&] { buildMemorySection(snapshot, raw); },
      [&] { buildDisplaysSection(snapshot, raw); },
      [&] { buildStorageSection(snapshot, raw, volumes); },
      [&] { buildNetworkAdaptersSection(snapshot, raw); },
      [&] { buildPrintersSection(snapshot, raw); },
      [&] { buildUsbSection(snapshot, raw, runner, volumes); },
      [&] { buildOperatingSystemSection(snapshot, raw); },
      [&] { buildUsersSection(snapshot, runner); },
      [&] { buildApplicationsSection(snapshot, raw); },
      [&] { buildPlugInsSection(snapshot, files, runner); },
      [&] { buildProcessesSection(snapshot, raw); },
      [&] { buildEnvironmentSection(snapshot, runner); },
      [&] { buildFirewallSection(snapshot, raw); },
  };
  if (log) {
    std::fputs("IV. PostProcess>>>\n", out);
    std::fflush(out);
  }
  int number = 0;
  for (const auto& step : steps) {
    ++number;
    if (log) {
      std::fprintf(out, "%d...", number);
      std::fflush(out);
    }
    step();
    if (log) {
      std::fputs("done\n", out);
      std::fflush(out);
    }
  }
  if (log) {
    std::fputs("IV. PostProcess End.\n", out);
    std::fflush(out);
  }
}

}  // namespace cvn
