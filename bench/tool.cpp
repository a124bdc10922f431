// `wavemill wv pack` of 2^25 samples of raw int16 IQ from a file, the whole
// program run as a user runs it, beside the library's own streaming export
// of the same samples in this process: the same chunks of 2^20 samples,
// already big-endian in memory, through streamingExporter2. The tool reads
// the file and swaps the bytes on top, and starts a process; the target is
// that it keeps at least 0.8 of the library's throughput.

#include "wavemill/tools/Tools.h"
#include "wavemill/waveform/StreamingExporter2.h"
#include "wavemill/waveform/exportimport/WaveformHeader.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

constexpr std::size_t samples = std::size_t{1} << 25;
constexpr std::size_t chunk = std::size_t{1} << 20;

const std::string &folder() {
  static const std::string path = [] {
    const auto dir = std::filesystem::temp_directory_path() / "wavemill-bench-tool";
    std::filesystem::create_directories(dir);
    return dir.string();
  }();
  return path;
}

// The samples as little-endian int16 I, Q: what the tool reads.
const std::string &inputFile() {
  static const std::string path = [] {
    const std::string file = folder() + "/in.i16";
    std::vector<unsigned char> bytes(samples * 4);
    for (std::size_t n = 0; n < bytes.size(); ++n)
      bytes[n] = static_cast<unsigned char>(n * 131 + (n >> 12));
    std::ofstream(file, std::ios::binary)
        .write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    return file;
  }();
  return path;
}

void BM_ToolPackInt16File(benchmark::State &state) {
  const std::string out = folder() + "/tool.wv";
  const std::string command = std::string(WAVEMILL_TOOL) + " wv pack --quiet -f i16 " + inputFile() + " " + out;
  for (auto _ : state) {
    if (Tools::startProcess(command, -1) != 0 || !Tools::exist(out))
      state.SkipWithError("wavemill did not run");
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * samples * 4));
  std::remove(out.c_str());
}
BENCHMARK(BM_ToolPackInt16File)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(5);

void BM_LibraryStreamingExport(benchmark::State &state) {
  const std::string out = folder() + "/library.wv";
  std::vector<unsigned char> iq(samples * 4);
  for (std::size_t n = 0; n < iq.size(); ++n)
    iq[n] = static_cast<unsigned char>((n ^ 1) * 131 + ((n ^ 1) >> 12)); // the tool's input, big-endian
  for (auto _ : state) {
    ExportImport::WaveformHeader header;
    auto bytes = header.getHeaderBytes();
    streamingExporter2 exporter(out, bytes.data(), static_cast<int>(bytes.size()));
    exporter.start(static_cast<int64_t>(samples), false);
    for (std::size_t n = 0; n < samples; n += chunk)
      exporter.streamiq(iq.data() + n * 4, static_cast<int>(chunk * 4));
    exporter.stop();
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * samples * 4));
  std::remove(out.c_str());
}
BENCHMARK(BM_LibraryStreamingExport)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(5);

} // namespace

BENCHMARK_MAIN();
