// Serialising a section-sized tree of about 100,000 tags: the dump (with its
// measuring pass) against the level-9 compression of the same text.
#include <benchmark/benchmark.h>

#include <string>
#include <vector>

#include "zxml/tag.h"
#include "zxml/zXML.h"

namespace {

// 20,000 records of five tags each, with the mix of value kinds and
// annotations the section builders produce.
cvn::TagTree makeTree() {
  cvn::TagTree t(true, "Snapshot");
  {
    cvn::Tag& apps = t.top().addChild("Applications");
    for (int i = 1; i <= 20000; ++i) {
      cvn::Tag& app = apps.addChild("Application:" + std::to_string(i));
      app.addAnnotation("complex", "");
      app.setProperty("name", cvn::TagValue("Application number " + std::to_string(i)));
      app.setProperty("version", cvn::TagValue("10." + std::to_string(i % 17) + ".2"));
      app.setProperty("size", cvn::TagValue(i * 0.37), "base-value",
                      std::to_string(i * 397).c_str());
      app.setProperty("installed", cvn::TagValue(i % 3 == 0));
      app.setChildValue("path", cvn::TagValue("/Applications/App" + std::to_string(i) + ".app"));
      app.setChildValue("bytes", cvn::TagValue(int64_t{i} * 1048576));
      app.setChildValue("kind", cvn::TagValue("Universal"));
      app.addChild("info").setProperty(
          "text", cvn::TagValue("Copyright 2014, vendor " + std::to_string(i % 50)));
    }
  }
  return t;
}

const cvn::TagTree& sampleTree() {
  static const cvn::TagTree tree = makeTree();
  return tree;
}

std::string dumpedText() {
  const cvn::TagTree& tree = sampleTree();
  std::string text(tree.textSize(), '\0');
  text.resize(tree.dumpText(&text[0], 0, cvn::kCloseTags, cvn::kWithChildren));
  return text;
}

void BM_MeasureAndDump(benchmark::State& state) {
  const cvn::TagTree& tree = sampleTree();
  size_t length = 0;
  for (auto _ : state) {
    std::vector<char> buffer(tree.textSize(), '\0');
    length = tree.dumpText(buffer.data(), 0, cvn::kCloseTags, cvn::kWithChildren);
    benchmark::DoNotOptimize(buffer.data());
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * length));
  state.counters["text_bytes"] = static_cast<double>(length);
}
BENCHMARK(BM_MeasureAndDump)->Unit(benchmark::kMillisecond);

void BM_CompressLevel9(benchmark::State& state) {
  std::string text = dumpedText();
  size_t packed = 0;
  for (auto _ : state) {
    std::vector<uint8_t> out = cvn::compressLevel9(reinterpret_cast<const uint8_t*>(text.data()),
                                                   text.size(), cvn::kZxmlModule, 6);
    packed = out.size();
    benchmark::DoNotOptimize(out.data());
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * text.size()));
  state.counters["ratio"] = static_cast<double>(text.size()) / static_cast<double>(packed);
}
BENCHMARK(BM_CompressLevel9)->Unit(benchmark::kMillisecond);

void BM_Serialise(benchmark::State& state) {
  const cvn::TagTree& tree = sampleTree();
  size_t text_size = dumpedText().size();
  for (auto _ : state) {
    std::vector<uint8_t> block = tree.serialise(cvn::kCompressed, cvn::kWholeText);
    benchmark::DoNotOptimize(block.data());
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * text_size));
}
BENCHMARK(BM_Serialise)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
