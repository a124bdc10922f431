// Instrument traffic against the simulated instrument on 127.0.0.1, beside a
// raw client written here (blocking send and receive on the same socket
// layer) that talks to the same server:
// - "*IDN?" round trips through Instrument::query and through the raw client;
// - a 64 MiB block sent with Instrument::sendBlock and raw, each followed by
//   "*OPC?" so that the time covers the server taking in every byte;
// - a 64 MiB block read with Instrument::queryBlock and raw.
// - the same "*IDN?" round trips and a 64 MiB Instrument::sendBlock through a
//   VISA address (Wavemill's own libcorvisa.so over the same loopback).
// The ratios of these pairs are what the README reports.

#include "wavemill/instrument/Instrument.h"
#include "wavemill/simulator/SimulatedInstrument.h"

#include "platform/Environment.h"
#include "platform/Socket.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstring>
#include <stdexcept>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;

namespace {

constexpr std::size_t blockSize = std::size_t{64} << 20;

SimulatedInstrument &simulator() {
  static SimulatedInstrument instance;
  return instance;
}

const std::vector<unsigned char> &blockData() {
  static const std::vector<unsigned char> data = [] {
    std::vector<unsigned char> bytes(blockSize);
    for (std::size_t i = 0; i < bytes.size(); ++i)
      bytes[i] = static_cast<unsigned char>(i * 131 + 7);
    return bytes;
  }();
  return data;
}

// The raw client: a blocking socket, whole sends, receives until a line
// feed or a byte count.
class RawClient {
public:
  RawClient() : socket(Platform::openTcpSocket()) {
    Platform::setReceiveTimeout(socket, 20000);
    Platform::setSendTimeout(socket, 20000);
    if (Platform::connectIPv4(socket, "127.0.0.1", simulator().getPort()) != 0)
      throw std::runtime_error("raw client: cannot connect to the simulated instrument");
  }
  ~RawClient() { Platform::closeSocket(socket); }

  void send(const void *data, std::size_t size) {
    if (Platform::sendAll(socket, data, size) != static_cast<long>(size))
      throw std::runtime_error("raw client: send failed");
  }
  void send(const std::string &text) { send(text.data(), text.size()); }

  std::string readLine() {
    std::string line;
    char buffer[8192];
    for (;;) {
      const long got = Platform::receiveBytes(socket, buffer, sizeof buffer);
      if (got <= 0)
        throw std::runtime_error("raw client: receive failed");
      line.append(buffer, static_cast<std::size_t>(got));
      if (line.back() == '\n')
        return line;
    }
  }

  void readExactly(void *data, std::size_t size) {
    if (Platform::receiveAll(socket, data, size) != static_cast<long>(size))
      throw std::runtime_error("raw client: short receive");
  }

private:
  Platform::SocketHandle socket;
};

std::string blockHeader(std::size_t size) {
  const std::string length = std::to_string(size);
  return "#" + std::to_string(length.size()) + length;
}

void storeBenchBlock() {
  RawClient client;
  client.send("MMEM:DATA 'bench'," + blockHeader(blockSize));
  client.send(blockData().data(), blockData().size());
  client.send("\n*OPC?\n");
  client.readLine();
}

void BM_IdnQueryInstrument(benchmark::State &state) {
  Instrument instrument(simulator().getAddress());
  instrument.query("*IDN?", 5000);
  for (auto _ : state)
    benchmark::DoNotOptimize(instrument.query("*IDN?", 5000));
}
BENCHMARK(BM_IdnQueryInstrument);

void BM_IdnQueryRaw(benchmark::State &state) {
  RawClient client;
  for (auto _ : state) {
    client.send("*IDN?\n");
    benchmark::DoNotOptimize(client.readLine());
  }
}
BENCHMARK(BM_IdnQueryRaw);

void BM_SendBlockInstrument(benchmark::State &state) {
  Instrument instrument(simulator().getAddress());
  std::vector<unsigned char> data = blockData();
  for (auto _ : state) {
    instrument.sendBlock("MMEM:DATA 'sent',", data, 4096);
    benchmark::DoNotOptimize(instrument.query("*OPC?", 20000));
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * blockSize));
}
BENCHMARK(BM_SendBlockInstrument)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_SendBlockRaw(benchmark::State &state) {
  RawClient client;
  const std::string header = "MMEM:DATA 'sent',#8" + std::to_string(blockSize);
  for (auto _ : state) {
    client.send(header);
    client.send(blockData().data(), blockData().size());
    client.send("\n*OPC?\n");
    benchmark::DoNotOptimize(client.readLine());
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * blockSize));
}
BENCHMARK(BM_SendBlockRaw)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_ReadBlockInstrument(benchmark::State &state) {
  storeBenchBlock();
  Instrument instrument(simulator().getAddress());
  for (auto _ : state) {
    auto block = instrument.queryBlock("MMEM:DATA? 'bench'", 20000);
    if (block.size() != blockSize)
      state.SkipWithError("short block");
    // The line feed behind the block stays in the input; take it off.
    instrument.readLine(20000);
    benchmark::DoNotOptimize(block.data());
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * blockSize));
}
BENCHMARK(BM_ReadBlockInstrument)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_ReadBlockRaw(benchmark::State &state) {
  storeBenchBlock();
  RawClient client;
  const std::string header = blockHeader(blockSize);
  for (auto _ : state) {
    client.send("MMEM:DATA? 'bench'\n");
    std::string head(header.size(), '\0');
    client.readExactly(&head[0], head.size());
    std::vector<unsigned char> block(blockSize);
    client.readExactly(block.data(), block.size());
    char end;
    client.readExactly(&end, 1);
    benchmark::DoNotOptimize(block.data());
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * blockSize));
}
BENCHMARK(BM_ReadBlockRaw)->Unit(benchmark::kMillisecond)->UseRealTime();

// The simulated instrument as a VISA resource: libcorvisa.so carries
// TCPIP0::127.0.0.1::inst0::INSTR to the port in CORVISA_INSTR_PORT.
std::string visaAddress() {
  Platform::setEnvironmentVariable("CORVISA_INSTR_PORT", std::to_string(simulator().getPort()));
  return "TCPIP0::127.0.0.1::inst0::INSTR";
}

void BM_IdnQueryVisa(benchmark::State &state) {
  Instrument instrument(visaAddress());
  instrument.query("*IDN?", 5000);
  for (auto _ : state)
    benchmark::DoNotOptimize(instrument.query("*IDN?", 5000));
}
BENCHMARK(BM_IdnQueryVisa);

void BM_SendBlockVisa(benchmark::State &state) {
  Instrument instrument(visaAddress());
  // A VISA block header carries the digit count but not the length, so the
  // data open with their own length digits for the simulator to read; the
  // zero byte that ends a VISA block is taken in by a throw-away *CLS.
  std::vector<unsigned char> data = blockData();
  const std::string length = std::to_string(blockSize - 8);
  std::copy(length.begin(), length.end(), data.begin());
  for (auto _ : state) {
    instrument.sendBlock("MMEM:DATA 'sent',", data, 4096);
    instrument.send("*CLS");
    benchmark::DoNotOptimize(instrument.query("*OPC?", 20000));
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * blockSize));
}
BENCHMARK(BM_SendBlockVisa)->Unit(benchmark::kMillisecond)->UseRealTime();

} // namespace

BENCHMARK_MAIN();
