// How fast property lists are read and written. Build with the release preset, then
//   build/release/propertylist_bench
// Bytes per second are those of the file, so that the figures can be set beside copying it.

#include <benchmark/benchmark.h>
#include <expat.h>
#include <malloc.h>

#include <cstring>
#include <string>
#include <vector>

#include "AccountsCorpus.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/binary/BinaryPropertyListSerializer.h"
#include "propertylist/xml/XMLPropertyList.h"

namespace accounts::bench {
namespace {

const PropertyValue& corpus() {
  static const PropertyValue value = accountsCorpus(10'000);
  return value;
}

const std::string& binaryFile() {
  static const std::string file = writeBinaryPropertyList(corpus()).value();
  return file;
}

const std::string& xmlFile() {
  static const std::string file = xmlOf(corpus());
  return file;
}

void countBytes(benchmark::State& state, std::size_t size) {
  state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(size));
  state.counters["fileBytes"] = static_cast<double>(size);
}

void copyBytes(benchmark::State& state) {
  const std::string& file = binaryFile();
  std::vector<char> target(file.size());
  for (auto _ : state) {
    std::memcpy(target.data(), file.data(), file.size());
    benchmark::ClobberMemory();
  }
  countBytes(state, file.size());
}
BENCHMARK(copyBytes)->Unit(benchmark::kMillisecond);

void readBinary(benchmark::State& state) {
  const std::string& file = binaryFile();
  for (auto _ : state) {
    auto value = readBinaryPropertyList(file);
    benchmark::DoNotOptimize(value);
    state.PauseTiming();
    // Lets go of what was read, which is not measured.
    *value = false;
    state.ResumeTiming();
  }
  countBytes(state, binaryFile().size());
}
BENCHMARK(readBinary)->Unit(benchmark::kMillisecond);

void readBinaryAndLetGo(benchmark::State& state) {
  const std::string& file = binaryFile();
  for (auto _ : state) {
    auto value = readBinaryPropertyList(file);
    benchmark::DoNotOptimize(value);
  }
  countBytes(state, binaryFile().size());
}
BENCHMARK(readBinaryAndLetGo)->Unit(benchmark::kMillisecond);

void writeValue(benchmark::State& state, const PropertyValue& value) {
  for (auto _ : state) {
    auto file = writeBinaryPropertyList(value);
    benchmark::DoNotOptimize(file);
  }
  countBytes(state, binaryFile().size());
}

// Equal texts share their memory, as after reading a file.
void writeBinaryAfterReading(benchmark::State& state) {
  writeValue(state, readBinaryPropertyList(binaryFile()).value());
}
BENCHMARK(writeBinaryAfterReading)->Unit(benchmark::kMillisecond);

// As a save takes the bytes: they never stand in memory whole.
void writeBinaryInPieces(benchmark::State& state) {
  const PropertyValue value = readBinaryPropertyList(binaryFile()).value();
  for (auto _ : state) {
    const SerializedPropertyList file = BinaryPropertyListSerializer().serialize(value).value();
    const bool areTaken = file.giveTo([](std::string_view piece) {
      benchmark::DoNotOptimize(piece.data());
      return true;
    });
    benchmark::DoNotOptimize(areTaken);
  }
  countBytes(state, binaryFile().size());
}
BENCHMARK(writeBinaryInPieces)->Unit(benchmark::kMillisecond);

// Every text has memory of its own, keys too.
void writeBinaryBuiltInMemory(benchmark::State& state) {
  writeValue(state, corpus());
}
BENCHMARK(writeBinaryBuiltInMemory)->Unit(benchmark::kMillisecond);

void readXML(benchmark::State& state) {
  const std::string& file = xmlFile();
  for (auto _ : state) {
    auto value = readXMLPropertyList(file);
    benchmark::DoNotOptimize(value);
    state.PauseTiming();
    // Lets go of what was read, which is not measured.
    *value = false;
    state.ResumeTiming();
  }
  countBytes(state, xmlFile().size());
}
BENCHMARK(readXML)->Unit(benchmark::kMillisecond);

// What expat takes to deliver the same file's events to somebody who does nothing with them.
void expatAlone(benchmark::State& state) {
  const std::string& file = xmlFile();
  for (auto _ : state) {
    const XML_Parser parser = XML_ParserCreate(nullptr);
    XML_SetElementHandler(
        parser, [](void*, const char*, const char**) {}, [](void*, const char*) {});
    XML_SetCharacterDataHandler(parser, [](void*, const char*, int) {});
    const XML_Status status =
        XML_Parse(parser, file.data(), static_cast<int>(file.size()), /*isFinal=*/1);
    benchmark::DoNotOptimize(status);
    XML_ParserFree(parser);
  }
  countBytes(state, xmlFile().size());
}
BENCHMARK(expatAlone)->Unit(benchmark::kMillisecond);

}  // namespace
}  // namespace accounts::bench

int main(int argumentCount, char** arguments) {
  // Memory that one run lets go of stays for the next one. Otherwise it would depend on where the
  // last piece happens to lie whether the system finds and clears all of it anew for each run.
  mallopt(M_MMAP_MAX, 0);
  mallopt(M_TRIM_THRESHOLD, 1 << 30);
  benchmark::Initialize(&argumentCount, arguments);
  if (benchmark::ReportUnrecognizedArguments(argumentCount, arguments)) {
    return 1;
  }
  benchmark::RunSpecifiedBenchmarks();
  return 0;
}
