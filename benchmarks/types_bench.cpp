// SPDX-License-Identifier: MIT
// The type of an extension, known and unknown ones mixed, beside a map ordered by strcasecmp.
#include <benchmark/benchmark.h>
#include <orb/path/file_type.h>
#include <strings.h>

#include <cctype>
#include <map>
#include <random>
#include <string>
#include <vector>

namespace {

const char* const kKnown[] = {".avi",  ".bmp", ".crw",  ".cr2",  ".csv", ".jpeg", ".jpg", ".tif",
                              ".tiff", ".mov", ".mp4",  ".mpeg", ".mpg", ".rwq",  ".rwv", ".dsq",
                              ".rwc",  ".pct", ".pict", ".txt",  ".png", ".wav",  ".wmv", ".xmp",
                              ".pqf",  ".mpo", ".log",  ".lga",  ".lgb", ".sdcq"};

struct Less {
  bool operator()(const std::string& a, const std::string& b) const {
    return ::strcasecmp(a.c_str(), b.c_str()) < 0;
  }
};

std::vector<std::string> Texts() {
  std::vector<std::string> texts{".doc", ".JPE", ".zip", ".m", ".xmpx", ".html"};
  for (const char* known : kKnown) {
    texts.emplace_back(known);
    std::string upper = known;
    for (char& letter : upper) letter = static_cast<char>(std::toupper(letter));
    texts.push_back(upper);
  }
  return texts;
}

/// Asks for the texts in an order that no branch predictor learns.
template <typename Text, typename Lookup>
void AskAll(benchmark::State& state, const std::vector<Text>& texts, Lookup lookup) {
  std::mt19937 random(30);
  std::vector<const Text*> asked(1 << 14);
  for (const Text*& text : asked) text = &texts[random() % texts.size()];
  std::size_t next = 0;
  for (auto _ : state) benchmark::DoNotOptimize(lookup(*asked[next++ % asked.size()]));
}

void TypeByExtension_Orb(benchmark::State& state) {
  std::vector<COrbStringData> texts;
  for (const std::string& text : Texts()) texts.emplace_back(OrbCharUtf8(text.c_str()));
  AskAll(
      state, texts, [](const COrbStringData& text) { return OrbPathConvertExtensionToType(text); });
}
BENCHMARK(TypeByExtension_Orb)->Name("TypeByExtension/Orb");

void TypeByExtension_map_strcasecmp(benchmark::State& state) {
  std::map<std::string, int, Less> types;
  for (const char* known : kKnown) types.emplace(known, static_cast<int>(types.size()));
  AskAll(state, Texts(), [&](const std::string& text) {
    const auto found = types.find(text);
    return found == types.end() ? 0 : found->second;
  });
}
BENCHMARK(TypeByExtension_map_strcasecmp)->Name("TypeByExtension/std-map-strcasecmp");

}  // namespace

BENCHMARK_MAIN();
