// The agent's own work against its floor. A scan cannot cost less than
// reading the profiler document once and compressing its result once, so
// the floor is one expat pass with empty handlers over the document plus
// one zlib level-9 pass over the ZXML text of the result's two trees. Each
// run times the whole pipeline, then its stages one by one, then the floor,
// all in CPU time of this thread, and reports the medians and the ratio of
// the pipeline to the floor. The ratio should stay flat as the document
// grows; a ratio that climbs means work that grows faster than the input.
// plist_bytes_per_doc_byte is the parsed list's heap against the document:
// the list is one of the trees a scan holds in turn, so it should stay
// about the document's size or under.
//
//   build/scan_floor_bench [--benchmark_filter=/160000]
#include <benchmark/benchmark.h>
#include <expat.h>
#include <time.h>

#include <algorithm>
#include <string>
#include <vector>

#include "../tests/fake_scan_sources.h"
#include "collect/plist.h"
#include "collect/plist_converter.h"
#include "main/post_processor.h"
#include "main/scan_pipeline.h"
#include "profiler_document.h"
#include "zxml/QAXfile.h"
#include "zxml/tag.h"
#include "zxml/zXML.h"

namespace cvn {
namespace {

double cpuSeconds() {
  timespec ts;
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &ts);
  return static_cast<double>(ts.tv_sec) + static_cast<double>(ts.tv_nsec) / 1e9;
}

double median(std::vector<double> values) {
  std::sort(values.begin(), values.end());
  size_t n = values.size();
  return n == 0 ? 0.0 : n % 2 ? values[n / 2] : (values[n / 2 - 1] + values[n / 2]) / 2;
}

void XMLCALL ignoreStart(void*, const XML_Char*, const XML_Char**) {}
void XMLCALL ignoreEnd(void*, const XML_Char*) {}
void XMLCALL ignoreText(void*, const XML_Char*, int) {}

// Fed in the same 1 MiB pieces as the property-list reader.
void expatPass(const std::string& document) {
  XML_Parser parser = XML_ParserCreate("UTF-8");
  XML_SetElementHandler(parser, ignoreStart, ignoreEnd);
  XML_SetCharacterDataHandler(parser, ignoreText);
  constexpr size_t kChunk = 1 << 20;
  for (size_t offset = 0; offset < document.size(); offset += kChunk) {
    size_t len = std::min(kChunk, document.size() - offset);
    bool last = offset + len == document.size();
    if (XML_Parse(parser, document.data() + offset, static_cast<int>(len), last) != XML_STATUS_OK)
      break;
  }
  XML_ParserFree(parser);
}

std::string zxmlText(const TagTree& tree) {
  std::string text(tree.textSize(), '\0');
  text.resize(tree.dumpText(&text[0], 0, kCloseTags, kWithChildren));
  return text;
}

size_t zlibPass(const std::string& text) {
  return compressLevel9(reinterpret_cast<const uint8_t*>(text.data()), text.size(), kZxmlModule)
      .size();
}

struct Samples {
  std::vector<double> total, parse, convert, builders, serialise, expat, zlib, floor, ratio;
};

void BM_ScanAgainstFloor(benchmark::State& state) {
  const std::string document = makeDocument(static_cast<int>(state.range(0)));
  FakeScanSources fakes;
  fakes.runner.answer("ls -1 /Users/", "jane\n");
  Samples s;
  double text_bytes = 0;
  double plist_bytes = 0;
  for (auto _ : state) {
    // The whole pipeline, as the driver runs it (the document moves in).
    std::string copy = document;
    double start = cpuSeconds();
    ScanResult result = runScanPipeline(std::move(copy), {}, ScanRequest(), fakes.sources());
    double total = cpuSeconds() - start;
    state.SetIterationTime(total);

    // The same stages one by one, for the table.
    double t = cpuSeconds();
    Plist plist;
    parsePlist(document, &plist);
    double parsed = cpuSeconds();
    plist_bytes = static_cast<double>(plist.bytesReserved());
    auto raw = std::make_unique<TagTree>(true, "Macintosh");
    PlistConverter(*raw).convertPlist(plist);
    plist = Plist();
    double converted = cpuSeconds();
    TagTree snapshot(true, "Snapshot");
    postProcess(snapshot, *raw, SectionSources{fakes.runner, fakes.files, ""}, nullptr);
    raw.reset();
    double built = cpuSeconds();
    SnapshotFile file(true);
    file.addTree(snapshot, kSnapshotBlock, kWholeText, kCompressed);
    file.addTree(*result.asset_info, kAssetInfoBlock, kWholeText, kCompressed);
    benchmark::DoNotOptimize(file.makeImage(kCompressedDirectory));
    double serialised = cpuSeconds();

    // The floor over the same document and the same result text.
    const std::string snapshot_text = zxmlText(*result.snapshot);
    const std::string asset_text = zxmlText(*result.asset_info);
    text_bytes = static_cast<double>(snapshot_text.size() + asset_text.size());
    double f = cpuSeconds();
    expatPass(document);
    double read = cpuSeconds();
    benchmark::DoNotOptimize(zlibPass(snapshot_text) + zlibPass(asset_text));
    double packed = cpuSeconds();

    s.total.push_back(total);
    s.parse.push_back(parsed - t);
    s.convert.push_back(converted - parsed);
    s.builders.push_back(built - converted);
    s.serialise.push_back(serialised - built);
    s.expat.push_back(read - f);
    s.zlib.push_back(packed - read);
    s.floor.push_back(packed - f);
    s.ratio.push_back(total / (packed - f));
  }
  auto ms = [](const std::vector<double>& v) { return benchmark::Counter(median(v) * 1e3); };
  state.counters["parse_ms"] = ms(s.parse);
  state.counters["convert_ms"] = ms(s.convert);
  state.counters["build_ms"] = ms(s.builders);
  state.counters["save_ms"] = ms(s.serialise);
  state.counters["total_ms"] = ms(s.total);
  state.counters["expat_ms"] = ms(s.expat);
  state.counters["zlib_ms"] = ms(s.zlib);
  state.counters["floor_ms"] = ms(s.floor);
  state.counters["ratio"] = median(s.ratio);
  state.counters["doc_MB"] = static_cast<double>(document.size()) / 1e6;
  state.counters["text_MB"] = text_bytes / 1e6;
  state.counters["plist_bytes_per_doc_byte"] = plist_bytes / static_cast<double>(document.size());
}

BENCHMARK(BM_ScanAgainstFloor)
    ->Arg(2500)
    ->Arg(10000)
    ->Arg(40000)
    ->Arg(80000)
    ->Arg(160000)
    ->Iterations(5)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond);

}  // namespace
}  // namespace cvn

BENCHMARK_MAIN();
