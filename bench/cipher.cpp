// The block stream cipher of the waveform files beside OpenSSL's AES-128-ECB
// (padding off) over the same buffers, on each code path of Rijndael, and
// SHA-1 over a 32-byte file head. Cipher benchmarks report bytes per
// second, so the ratio to OpenSSL reads straight off the output.

#include "wavemill/waveform/EncryptKey.h"
#include "wavemill/waveform/Encryptor.h"
#include "wavemill/waveform/Rijndael.h"
#include "wavemill/waveform/SecureHash.h"

#include <benchmark/benchmark.h>
#include <openssl/evp.h>

#include <cstdint>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

const std::vector<std::int64_t> sizes = {1024, 16 * 1024, 1024 * 1024};

std::vector<unsigned char> input(std::int64_t size) {
  std::vector<unsigned char> bytes(static_cast<std::size_t>(size));
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    bytes[i] = static_cast<unsigned char>(i * 131 + 7);
  }
  return bytes;
}

const char *pathName(Rijndael::Acceleration path) {
  switch (path) {
  case Rijndael::Acceleration::Portable:
    return "portable";
  case Rijndael::Acceleration::AesNi:
    return "aes-ni";
  case Rijndael::Acceleration::Vaes:
    return "vaes";
  }
  return "?";
}

// Arguments: buffer bytes, the cap on the code path (0 portable, 1 AES-NI, 2 VAES).
template <typename Cipher> void BM_Process(benchmark::State &state) {
  const auto wanted = static_cast<Rijndael::Acceleration>(state.range(1));
  if (wanted > Rijndael::getHardwareAcceleration()) {
    state.SkipWithError("this processor lacks the instructions of the path");
    return;
  }
  Rijndael::setAcceleration(wanted);
  const auto in = input(state.range(0));
  std::vector<unsigned char> out(in.size());
  Cipher cipher;
  cipher.init(fixedFileKey);
  for (auto _ : state) {
    benchmark::DoNotOptimize(cipher.process(out.data(), in.data(), static_cast<unsigned int>(in.size())));
    benchmark::ClobberMemory();
  }
  state.SetBytesProcessed(state.iterations() * state.range(0));
  state.SetLabel(pathName(Rijndael::getAcceleration()));
  Rijndael::setAcceleration(Rijndael::Acceleration::Vaes);
}

void BM_OpenSslEcb(benchmark::State &state, bool encrypt) {
  const auto in = input(state.range(0));
  std::vector<unsigned char> out(in.size());
  EVP_CIPHER_CTX *ctx = EVP_CIPHER_CTX_new();
  EVP_CipherInit_ex(ctx, EVP_aes_128_ecb(), nullptr, fixedFileKey, nullptr, encrypt ? 1 : 0);
  EVP_CIPHER_CTX_set_padding(ctx, 0);
  for (auto _ : state) {
    int length = 0;
    EVP_CipherUpdate(ctx, out.data(), &length, in.data(), static_cast<int>(in.size()));
    benchmark::DoNotOptimize(length);
    benchmark::ClobberMemory();
  }
  EVP_CIPHER_CTX_free(ctx);
  state.SetBytesProcessed(state.iterations() * state.range(0));
}

void BM_Sha1Of32Bytes(benchmark::State &state) {
  const auto head = input(32);
  unsigned char key[16];
  for (auto _ : state) {
    EncryptKey::generateKey(head.data(), key);
    benchmark::DoNotOptimize(key);
  }
}

void BM_OpenSslSha1Of32Bytes(benchmark::State &state) {
  const auto head = input(32);
  unsigned char digest[20];
  unsigned int length = 0;
  for (auto _ : state) {
    EVP_Digest(head.data(), head.size(), digest, &length, EVP_sha1(), nullptr);
    benchmark::DoNotOptimize(digest);
  }
}

} // namespace

BENCHMARK_TEMPLATE(BM_Process, Encryptor)->ArgsProduct({sizes, {2, 1, 0}});
BENCHMARK_CAPTURE(BM_OpenSslEcb, encrypt, true)->ArgsProduct({sizes});
BENCHMARK_TEMPLATE(BM_Process, Decryptor)->ArgsProduct({sizes, {2, 1, 0}});
BENCHMARK_CAPTURE(BM_OpenSslEcb, decrypt, false)->ArgsProduct({sizes});
BENCHMARK(BM_Sha1Of32Bytes);
BENCHMARK(BM_OpenSslSha1Of32Bytes);

BENCHMARK_MAIN();
