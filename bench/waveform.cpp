// Writing and reading waveform files. The export benchmarks stream 2^25
// samples (128 MiB of file-form IQ) in 1 MiB chunks to a file in the
// current folder, beside a baseline that encrypts the same bytes with
// OpenSSL's AES-128-ECB and writes them with fwrite in the same chunks;
// both report bytes per second, so the ratio reads off the output. The
// conversion benchmarks turn doubles into big-endian 16-bit IQ, Exporter2's
// way (normalise, round, store) beside Tools::getWaveformBytes, in samples
// per second. The import benchmarks read such a file back (see below).

#include "wavemill/tools/Tools.h"
#include "wavemill/waveform/EncryptKey.h"
#include "wavemill/waveform/StreamingExporter2.h"
#include "wavemill/waveform/StreamingImporter2.h"

#include <benchmark/benchmark.h>
#include <openssl/evp.h>

#include <cmath>
#include <complex>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

constexpr std::int64_t totalSamples = std::int64_t{1} << 25;
constexpr std::size_t chunkBytes = 1 << 20;
constexpr std::int64_t fileBytes = totalSamples * 4;
const char *const target = "wavemill_bench_waveform.wv";

std::vector<unsigned char> chunkOfIq() {
  std::vector<unsigned char> bytes(chunkBytes);
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    bytes[i] = static_cast<unsigned char>(i * 131 + 7);
  }
  return bytes;
}

void BM_StreamingExporter2Write(benchmark::State &state) {
  auto chunk = chunkOfIq();
  unsigned char header[40] = {};
  for (auto _ : state) {
    streamingExporter2 exporter(target, header, sizeof header);
    exporter.start(totalSamples, false);
    for (std::int64_t at = 0; at < fileBytes; at += chunkBytes) {
      exporter.streamiq(chunk.data(), static_cast<int>(chunk.size()));
    }
    exporter.stop();
    if (exporter.failed()) {
      state.SkipWithError("cannot write the file in the current folder");
      break;
    }
  }
  std::remove(target);
  state.SetBytesProcessed(state.iterations() * fileBytes);
}

void BM_OpenSslEncryptAndFwrite(benchmark::State &state) {
  auto chunk = chunkOfIq();
  std::vector<unsigned char> cipher(chunk.size());
  EVP_CIPHER_CTX *ctx = EVP_CIPHER_CTX_new();
  EVP_EncryptInit_ex(ctx, EVP_aes_128_ecb(), nullptr, fixedFileKey, nullptr);
  EVP_CIPHER_CTX_set_padding(ctx, 0);
  for (auto _ : state) {
    std::FILE *file = std::fopen(target, "wb");
    if (file == nullptr) {
      state.SkipWithError("cannot write the file in the current folder");
      break;
    }
    for (std::int64_t at = 0; at < fileBytes; at += chunkBytes) {
      int length = 0;
      EVP_EncryptUpdate(ctx, cipher.data(), &length, chunk.data(), static_cast<int>(chunk.size()));
      std::fwrite(cipher.data(), 1, static_cast<std::size_t>(length), file);
    }
    std::fclose(file);
  }
  EVP_CIPHER_CTX_free(ctx);
  std::remove(target);
  state.SetBytesProcessed(state.iterations() * fileBytes);
}

// Exposes the conversion that setData runs before packaging.
class Converter : public streamingExporter2 {
public:
  Converter() : streamingExporter2("", nullptr, 0) {}
  bool convert(std::vector<double> &i, std::vector<double> &q) {
    return convertData(i.data(), q.data(), nullptr, static_cast<int>(i.size()), 0);
  }
};

constexpr std::size_t conversionSamples = 1 << 20;

double wave(std::size_t s, double phase) { return 0.7 * std::sin(0.001 * static_cast<double>(s) + phase); }

void BM_Exporter2ConvertDoubles(benchmark::State &state) {
  std::vector<double> i(conversionSamples), q(conversionSamples);
  for (std::size_t s = 0; s < conversionSamples; ++s) {
    i[s] = wave(s, 0.0);
    q[s] = wave(s, 1.0);
  }
  Converter converter;
  for (auto _ : state) {
    benchmark::DoNotOptimize(converter.convert(i, q));
  }
  state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(conversionSamples));
}

void BM_ToolsGetWaveformBytes(benchmark::State &state) {
  std::vector<std::complex<double>> samples(conversionSamples);
  for (std::size_t s = 0; s < conversionSamples; ++s) {
    samples[s] = {wave(s, 0.0), wave(s, 1.0)};
  }
  for (auto _ : state) {
    benchmark::DoNotOptimize(Tools::getWaveformBytes(samples, 1.0));
  }
  state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(conversionSamples));
}

} // namespace

BENCHMARK(BM_StreamingExporter2Write)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_OpenSslEncryptAndFwrite)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_Exporter2ConvertDoubles)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_ToolsGetWaveformBytes)->Unit(benchmark::kMillisecond);

// Import: streamingImporter2 delivering the IQ of a file of 2^25 samples
// (with markers) in 1 MiB pieces, beside OpenSSL's AES-128-ECB decrypting
// the same file read with fread in the same pieces; bytes per second on
// both sides. The file is written once, stays in the page cache, and is
// removed at exit.
namespace {

const char *const readTarget = "wavemill_bench_waveform_read.wv";

struct ReadFile {
  ReadFile() {
    auto chunk = chunkOfIq();
    std::vector<unsigned char> markers(chunkBytes / 4);
    unsigned char header[40] = {};
    streamingExporter2 exporter(readTarget, header, sizeof header);
    exporter.start(totalSamples, true);
    for (std::int64_t at = 0; at < fileBytes; at += chunkBytes) {
      exporter.stream(chunk.data(), markers.data(), chunkBytes / 4, at + chunkBytes >= fileBytes);
    }
    written = !exporter.failed();
  }
  ~ReadFile() { std::remove(readTarget); }
  bool written = false;
};

bool readFileWritten() {
  static ReadFile file;
  return file.written;
}

void BM_StreamingImporter2ReadIq(benchmark::State &state) {
  if (!readFileWritten()) {
    state.SkipWithError("cannot write the file in the current folder");
    return;
  }
  const std::string narrow = readTarget;
  const std::wstring path(narrow.begin(), narrow.end());
  std::vector<unsigned char> piece(chunkBytes);
  std::int64_t bytes = 0;
  for (auto _ : state) {
    streamingImporter2 importer;
    unsigned char key[16];
    std::memcpy(key, fixedFileKey, sizeof key);
    importer.Open(path.c_str(), key);
    for (int got; (got = importer.GetRawIQData(piece.data(), static_cast<int>(chunkBytes))) > 0;) {
      bytes += got;
    }
  }
  state.SetBytesProcessed(bytes);
}

void BM_OpenSslFreadAndDecrypt(benchmark::State &state) {
  if (!readFileWritten()) {
    state.SkipWithError("cannot write the file in the current folder");
    return;
  }
  std::vector<unsigned char> in(chunkBytes), out(chunkBytes + 16);
  std::int64_t bytes = 0;
  EVP_CIPHER_CTX *ctx = EVP_CIPHER_CTX_new();
  for (auto _ : state) {
    std::FILE *file = std::fopen(readTarget, "rb");
    EVP_DecryptInit_ex(ctx, EVP_aes_128_ecb(), nullptr, fixedFileKey, nullptr);
    EVP_CIPHER_CTX_set_padding(ctx, 0);
    for (std::size_t got; file != nullptr && (got = std::fread(in.data(), 1, in.size(), file)) > 0;) {
      int length = 0;
      EVP_DecryptUpdate(ctx, out.data(), &length, in.data(), static_cast<int>(got));
      bytes += length;
    }
    if (file != nullptr) {
      std::fclose(file);
    }
  }
  EVP_CIPHER_CTX_free(ctx);
  state.SetBytesProcessed(bytes);
}

} // namespace

BENCHMARK(BM_StreamingImporter2ReadIq)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_OpenSslFreadAndDecrypt)->Unit(benchmark::kMillisecond)->UseRealTime();

BENCHMARK_MAIN();
