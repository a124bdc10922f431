// The waveform number helpers on four million samples (64 MB of input),
// beside a memcpy of the same bytes as the memory-bandwidth baseline. Every
// benchmark reports the input bytes per second, so the ratio to memcpy reads
// straight off the output, and the heap allocations per call as "allocs".

#include "wavemill/tools/Tools.h"

#include "AllocationCounter.h"

#include <benchmark/benchmark.h>

#include <cmath>
#include <complex>
#include <cstdint>
#include <cstring>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

using wavemill_bench::AllocationCount;

constexpr std::size_t sampleCount = 4 * 1024 * 1024;
constexpr std::int64_t inputBytes = sampleCount * sizeof(std::complex<double>);

// A two-tone signal with a peak of about 0.9: every value takes the full
// conversion path and none is clipped.
const std::vector<std::complex<double>> &samples() {
  static const std::vector<std::complex<double>> data = [] {
    std::vector<std::complex<double>> values(sampleCount);
    for (std::size_t i = 0; i < sampleCount; ++i) {
      const double t = static_cast<double>(i);
      values[i] = {0.6 * std::cos(t * 0.0011) + 0.3 * std::sin(t * 0.37),
                   0.6 * std::sin(t * 0.0011) - 0.3 * std::cos(t * 0.37)};
    }
    return values;
  }();
  return data;
}

void finish(benchmark::State &state) { state.SetBytesProcessed(state.iterations() * inputBytes); }

void BM_MemcpyBaseline(benchmark::State &state) {
  const auto &input = samples();
  std::vector<std::complex<double>> copy(input.size());
  AllocationCount allocations(state);
  for (auto _ : state) {
    std::memcpy(copy.data(), input.data(), static_cast<std::size_t>(inputBytes));
    benchmark::DoNotOptimize(copy.data());
    benchmark::ClobberMemory();
  }
  finish(state);
}
BENCHMARK(BM_MemcpyBaseline)->Unit(benchmark::kMillisecond);

void BM_CalculatePeak(benchmark::State &state) {
  const auto &input = samples();
  AllocationCount allocations(state);
  for (auto _ : state)
    benchmark::DoNotOptimize(Tools::calculatePeak(input));
  finish(state);
}
BENCHMARK(BM_CalculatePeak)->Unit(benchmark::kMillisecond);

void BM_CalculateRms(benchmark::State &state) {
  const auto &input = samples();
  AllocationCount allocations(state);
  for (auto _ : state)
    benchmark::DoNotOptimize(Tools::calculateRms(input));
  finish(state);
}
BENCHMARK(BM_CalculateRms)->Unit(benchmark::kMillisecond);

void BM_ConvertToWaveform(benchmark::State &state) {
  const auto &input = samples();
  std::vector<unsigned char> bytes(input.size() * 4);
  AllocationCount allocations(state);
  for (auto _ : state) {
    Tools::convertToWaveform(input, bytes, 0.9);
    benchmark::DoNotOptimize(bytes.data());
    benchmark::ClobberMemory();
  }
  finish(state);
}
BENCHMARK(BM_ConvertToWaveform)->Unit(benchmark::kMillisecond);

// Includes the peak search and the new zero-filled 16 MB buffer of each call.
void BM_GetWaveformBytes(benchmark::State &state) {
  const auto &input = samples();
  AllocationCount allocations(state);
  for (auto _ : state)
    benchmark::DoNotOptimize(Tools::getWaveformBytes(input, 0.9));
  finish(state);
}
BENCHMARK(BM_GetWaveformBytes)->Unit(benchmark::kMillisecond);

} // namespace

BENCHMARK_MAIN();
