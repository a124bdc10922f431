#include "wavemill/tools/Tools.h"

#include "support/ExpectThrow.h"
#include "support/TempDir.h"

#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <cstdint>
#include <limits>
#include <memory>
#include <string>
#include <utility>
#include <vector>

using namespace Corvane::Wavemill;
using Corvane::Wavemill::Testing::TempDir;
using Corvane::Wavemill::Testing::thrown;

namespace {

using Samples = std::vector<std::complex<double>>;
using Bytes = std::vector<unsigned char>;

const double notANumber = std::numeric_limits<double>::quiet_NaN();

// The 16-bit words of a byte form, I and Q alternating.
std::vector<std::int16_t> words(const Bytes &bytes) {
  std::vector<std::int16_t> result;
  for (std::size_t i = 0; i + 1 < bytes.size(); i += 2)
    result.push_back(static_cast<std::int16_t>(static_cast<std::uint16_t>(bytes[i] << 8 | bytes[i + 1])));
  return result;
}

} // namespace

TEST(ToolsTest, ShortWaveformNameKeepsShortNamesAndCutsLongOnesToNineteenPlusEnding) {
  // 23 characters stay.
  EXPECT_EQ(Tools::getShortWaveformName("C:\\waves/dir\\Abc:defghijklmnopqrstuv"), "Abc_defghijklmnopqrstuv");
  EXPECT_EQ(Tools::getShortWaveformName("abcdefghijklmnopqrstuvwxyz.wfm"), "abcdefghijklmnopqrs.WFM");
}

TEST(ToolsTest, MirrorSpectrumNegatesQOnlyAndSaturatesTheMostNegativeValue) {
  Bytes bytes{0x12, 0x34, 0x00, 0x01, 0x80, 0x00, 0x80, 0x00, 0x7f, 0xff, 0x7f, 0xff, 0x00, 0x00, 0x00, 0x00};
  Tools::mirrorSpectrum(bytes);
  EXPECT_EQ(words(bytes), (std::vector<std::int16_t>{0x1234, -1, -32768, 32767, 32767, -32767, 0, 0}));

  Bytes six(6, 0x01);
  EXPECT_EQ(thrown([&] { Tools::mirrorSpectrum(six); }),
            "invalid_argument: mirrorSpectrum(waveform): Incorrect waveform length.");
}

TEST(ToolsTest, ParseDoubleArrayDropsForeignCharactersBeforeSplitting) {
  EXPECT_EQ(Tools::parseDoubleArray("1, 2,x3", ","), (std::vector<double>{1, 2, 3}));
  EXPECT_EQ(Tools::parseDoubleArray("1e3,,-2.5E-1,", ","), (std::vector<double>{1000, -0.25}));
  EXPECT_EQ(thrown([] { Tools::parseDoubleArray("", ","); }), "invalid_argument: input");
}

TEST(ToolsTest, PeakAndRmsCoverEveryComponentAndHandleSilenceAndNoSamples) {
  const Samples samples{{1, -0.5}, {2, 0.5}, {0.25, -7}}; // the peak in the last, odd pair
  EXPECT_EQ(Tools::calculatePeak(samples), 7.0);
  EXPECT_EQ(Tools::calculatePeak(std::shared_ptr<Samples>()), 0.0);

  EXPECT_DOUBLE_EQ(Tools::calculateRms(std::make_shared<Samples>(Samples(5, {3, -4}))), 5.0);
  EXPECT_EQ(Tools::calculateRms(Samples(9, {0, 0})), 1.0);
  EXPECT_TRUE(std::isnan(Tools::calculateRms(Samples{})));
}

TEST(ToolsTest, ConvertToWaveformClampsToSixteenBitsAndTakesNaNAsZero) {
  // Six samples, so that both the bulk of the loop and its tail see each case.
  const double inf = std::numeric_limits<double>::infinity();
  Bytes bytes(4 * 6, 0xaa);
  Tools::convertToWaveform(Samples{{1, -1}, {2, -2}, {notANumber, 0.5}, {inf, -inf}, {notANumber, 5}, {-3, 0.5}}, bytes,
                           1.0);
  EXPECT_EQ(words(bytes), (std::vector<std::int16_t>{32767, -32767, 32767, -32768, 0, 16384, 32767, -32768, 0, 32767,
                                                     -32768, 16384}));
}

TEST(ToolsTest, WaveformBytesScaleThePeakToFullRange) {
  const Samples samples{{0.5, -0.25}, {0.125, 0}};
  const auto bytes = Tools::getWaveformBytes(samples, 1.0);
  EXPECT_EQ(words(*bytes), (std::vector<std::int16_t>{32767, -16384, 8192, 0}));
}

TEST(ToolsTest, BuildMarkersClearsRunsOfFiveOrMoreLowSamplesThatAHighSampleEnds) {
  const std::complex<double> high{1, 0}, low{0.1, 0.1}, atThreshold{0.5, 0};
  const Samples samples{high, low, low,  low, low, low, atThreshold, low, low,
                        low,  low, high, low, low, low, low,         low, low};
  Bytes markers(samples.size(), 0x80);
  Tools::buildMarkers(samples, markers, 2, 0.5);
  // The run of four and the run that lasts to the end keep their bit.
  EXPECT_EQ(markers, (Bytes{0x84, 0x80, 0x80, 0x80, 0x80, 0x80, 0x84, 0x84, 0x84, 0x84, 0x84, 0x84, 0x84, 0x84, 0x84,
                            0x84, 0x84, 0x84}));

  Bytes untouched(samples.size(), 0x01);
  Tools::buildMarkers(samples, untouched, -1, 0.5);
  EXPECT_EQ(untouched, Bytes(samples.size(), 0x01));
}

TEST(ToolsTest, SetBitsWritesTheLowestBitOfTheValueIntoTheBytesThatExist) {
  Bytes bytes{0x00, 0xff, 0x00, 0xff, 0x00};
  Tools::setBits(bytes, 0, 1, 2, 2); // 2 has a clear lowest bit
  EXPECT_EQ(bytes, (Bytes{0x00, 0xfe, 0x00, 0xff, 0x00}));
  Tools::setBits(bytes, 7, 2, -1, 1);
  EXPECT_EQ(bytes, (Bytes{0x00, 0xfe, 0x80, 0xff, 0x80}));
  Tools::setBits(bytes, 1, -2, 3, 0); // byte 0 only
  Tools::setBits(bytes, 1, 4, 100, 1);
  Tools::setBits(bytes, 8, 0, -1, 1);
  EXPECT_EQ(bytes, (Bytes{0x00, 0xfe, 0x80, 0xff, 0x82}));
}

TEST(ToolsTest, GetPulseGivesStartAndEndOfEachRunOfTheBit) {
  const TempDir dir;
  const std::string small = dir.path("small"), across = dir.path("large");
  Tools::writeFile(small, Bytes{0, 2, 3, 0, 1, 2, 2, 2});
  EXPECT_EQ(Tools::getPulse(small, 100, 1), (std::vector<std::int64_t>{1, 2, 5, 7}));
  EXPECT_TRUE(Tools::getPulse(small + ".missing", 100, 1).empty());

  Bytes large(0x200000 + 10, 0); // a run across the boundary of two read blocks
  for (std::size_t i = 0x1ffffe; i <= 0x200002; ++i)
    large[i] = 0x10;
  Tools::writeFile(across, large);
  EXPECT_EQ(Tools::getPulse(across, 1 << 30, 4), (std::vector<std::int64_t>{0x1ffffe, 0x200002}));
}
