// The waveform section of the tour: a few periods of a sine with markers are
// written chunk by chunk into an encrypted waveform file under a filled
// header record, and read back: the header and the length through
// WaveformImporter, the first samples through the streaming importer.

#include "wavemill/wavemill.h"

#include <algorithm>
#include <cmath>
#include <complex>
#include <cstdio>
#include <iostream>
#include <memory>
#include <string>
#include <vector>

using namespace Corvane::Wavemill;
using namespace Corvane::Wavemill::ExportImport;

void waveforms() {
  std::cout << "\n== Waveform files ==\n";
  constexpr int periodLength = 64;
  constexpr int periods = 4;
  constexpr int samples = periodLength * periods;
  constexpr double pi = 3.14159265358979323846;

  std::vector<std::complex<double>> sine(samples);
  for (int n = 0; n < samples; ++n) {
    sine[n] = std::polar(1.0, 2 * pi * n / periodLength); // I = cos, Q = sin
  }
  // File form: four big-endian bytes a sample, peak at 0.8 of full scale.
  auto iq = Tools::getWaveformBytes(sine, 0.8);
  // One packed byte a sample: marker 1 at the start of every period, marker
  // 2 high over the first half of each.
  std::vector<unsigned char> markers(samples);
  for (int start = 0; start < samples; start += periodLength) {
    Tools::setBits(markers, 0, start, 1, 1);
    Tools::setBits(markers, 1, start, periodLength / 2, 1);
  }

  const std::string file =
      Path::combine(Tools::getTempPath(), "wavemill-demo-" + std::to_string(Tools::getCurrentProcessId()) + ".wv");
  WaveformPackage package;
  package.setFileName(file);
  // The record gives its fields no meaning; this application keeps a
  // description, its sample clock and two texts in them.
  auto header = package.getWaveformHeader();
  header->tag5 = "demo sine";
  header->tag6 = 100e6;
  header->hasTextBlocks = true;
  header->tag45 = "4 periods of 64 samples";
  header->tag46 = "Wavemill demo";
  std::cout << "write " << samples << " samples with markers to " << file << " in chunks of 100\n";
  package.begin(samples, true);
  for (int at = 0; at < samples; at += 100) {
    const int n = std::min(100, samples - at);
    package.append(gsl::span<unsigned char>(iq->data() + 4 * at, 4 * n)); // IQ before its markers
    package.appendMarker(gsl::span<unsigned char>(markers.data() + at, n));
  }
  package.end(); // joins the markers behind the IQ data

  WaveformImporter importer(file);
  const auto readBack = importer.getWaveformHeader();
  std::cout << "read back: header of " << importer.getHeaderBytes().size() << " bytes, " << importer.getDataLength()
            << " samples\n";
  if (readBack) {
    std::cout << "  description " << Tools::q(Tools::trim(readBack->tag5, ' ')) << ", sample clock "
              << static_cast<long long>(readBack->tag6) << " Hz, notes " << Tools::q(readBack->tag45) << " by "
              << Tools::q(readBack->tag46) << "\n";
  }

  // WaveformImporter::getData answers -1 by design; samples come through the
  // streaming importer, in pieces of any size.
  streamingImporter2 reader;
  if (reader.Open(Tools::toWString(file).c_str())) {
    short i[8];
    short q[8];
    unsigned char first[8];
    const int got = reader.GetIQData(i, q, 8);
    reader.GetMarkers(first, 8);
    std::cout << "  first samples (I, Q, markers):";
    for (int n = 0; n < got; ++n) {
      std::cout << " (" << i[n] << ", " << q[n] << ", " << int(first[n]) << ")";
    }
    std::cout << "\n";
  }
  reader.close();
  std::remove(file.c_str());
}
