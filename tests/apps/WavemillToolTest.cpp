// The wavemill program, run as a user runs it: through a shell, with real
// files in a temporary folder and a simulated instrument on 127.0.0.1.
#include "support/TempDir.h"

#include "wavemill/simulator/SimulatedInstrument.h"
#include "wavemill/tools/Tools.h"

#include <gtest/gtest.h>

#include <charconv>
#include <cmath>
#include <fstream>
#include <iterator>
#include <string>

namespace Corvane::Wavemill {
namespace {

using Testing::TempDir;

std::string readAll(const std::string &path) {
  std::ifstream in(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

void writeAll(const std::string &path, const std::string &bytes) { std::ofstream(path, std::ios::binary) << bytes; }

std::string quote(const std::string &text) {
  std::string out = "'";
  for (const char c : text)
    out += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return out + "'";
}

struct Result {
  int code = -1;
  std::string out;
  std::string err;
};

// Runs a shell command line in `dir` with the tool first on PATH, so that
// "wavemill ..." is the program under test, and collects what it printed.
Result run(const TempDir &dir, const std::string &commandLine) {
  const std::string tool = WAVEMILL_TOOL;
  const std::string script = "cd " + quote(dir.root()) + " && PATH=" + quote(tool.substr(0, tool.rfind('/'))) +
                             ":$PATH && export PATH && " + commandLine + " > .out 2> .err; echo $? > .rc";
  EXPECT_EQ(Tools::startProcess("/bin/sh -c " + quote(script), 120000), 0);
  Result result;
  const std::string rc = readAll(dir.path(".rc"));
  std::from_chars(rc.data(), rc.data() + rc.size(), result.code);
  result.out = readAll(dir.path(".out"));
  result.err = readAll(dir.path(".err"));
  std::remove(dir.path(".rc").c_str());
  return result;
}

std::string number(double value) {
  char text[32];
  return std::string(text, std::to_chars(text, text + sizeof text, value).ptr);
}

// "I,Q,markers" and one line per sample, I and Q in -1..1 and each a stored
// 16-bit code, so that unpacking writes the same text again.
std::string csv(int count) {
  std::string out = "I,Q,markers\n";
  for (int n = 0; n < count; ++n) {
    const double i = std::round(std::sin(n * 0.01) * 32767) / 32767;
    const double q = n % 7 == 0 ? -1.0 : std::round(std::cos(n * 0.01) * 16383) / 32767;
    out += number(i) + "," + number(q) + "," + number(n % 16) + "\n";
  }
  return out;
}

TEST(WavemillToolTest, PackInfoUnpackRoundTripThroughCsvRawSamplesAndMarkerFiles) {
  const std::string samples = csv(5003);
  TempDir dir;
  writeAll(dir.path("in.csv"), samples);
  const Result pack = run(dir, "wavemill wv pack in.csv out.wv");
  ASSERT_EQ(pack.code, 0) << pack.err;
  EXPECT_EQ(pack.err, ""); // no progress bar: standard error is a file

  const Result info = run(dir, "wavemill wv info out.wv");
  ASSERT_EQ(info.code, 0) << info.err;
  EXPECT_NE(info.out.find("samples        5003\n"), std::string::npos) << info.out;
  EXPECT_NE(info.out.find("format         integer\n"), std::string::npos);
  EXPECT_NE(info.out.find("markers        present\n"), std::string::npos);

  // Out as CSV, then as f32 with a marker file and in again from standard
  // input: the stored integers, and so the text, come back the same.
  const Result unpack =
      run(dir, "{ wavemill wv unpack out.wv - && wavemill wv unpack -f f32 out.wv back.f32 -m back.mkr "
               "&& cat back.f32 | wavemill wv pack -f f32 - again.wv -m back.mkr && wavemill wv "
               "unpack again.wv -; }");
  ASSERT_EQ(unpack.code, 0) << unpack.err;
  // The second text is packed from back.mkr, so it shows the marker file too.
  EXPECT_EQ(unpack.out, samples + samples);
}

TEST(WavemillToolTest, DrawsProgressOnlyOnATerminalAndNotWithQuiet) {
  // The input arrives in two parts a second apart, so the transfer outlasts
  // the half second before a bar is drawn.
  const std::string pack = "(head -c 400000 in.csv; sleep 1; tail -c +400001 in.csv) | wavemill wv pack - ";
  struct Row {
    std::string commandLine;
    bool drawn;
  };
  const Row rows[] = {
      {"script -qec " + quote(pack + "tty.wv") + " /dev/null", true}, // or the other rows prove nothing
      {"script -qec " + quote(pack + "quiet.wv --quiet") + " /dev/null", false},
      {pack + "file.wv", false},
  };
  TempDir dir;
  writeAll(dir.path("in.csv"), csv(30000));
  for (const auto &row : rows) {
    SCOPED_TRACE(row.commandLine);
    const Result result = run(dir, row.commandLine);
    EXPECT_EQ(result.code, 0) << result.err;
    // Under `script` the program's standard error is the terminal whose
    // output lands in .out.
    EXPECT_EQ((result.out + result.err).find("\rreading  ") != std::string::npos, row.drawn) << result.out;
  }
}

// Each command line prints its answer, or exits with 1 (a failure) or 2 (a
// usage error) and one line that names the cause, and leaves no output file.
TEST(WavemillToolTest, CommandsPrintTheirAnswerOrOneLineOfFailureAndLeaveNoOutput) {
  SimulatedInstrument simulator;
  const std::string address = simulator.getAddress();
  const std::string closed = "TCPIP0::127.0.0.1::1::SOCKET"; // nothing listens on port 1
  const std::string corvisa = std::string("WAVEMILL_VISA_LIBRARY=") + WAVEMILL_CORVISA_LIBRARY +
                              " CORVISA_RESOURCES='TCPIP0::127.0.0.1::inst0::INSTR;ASRL1::INSTR' ";
  struct Row {
    std::string commandLine;
    int code;
    std::string out;
    std::string err; // what standard error starts with
  };
  const Row rows[] = {
      {"wavemill scpi " + address + " '*IDN?' 'FREQ 2e9' 'FREQ?'", 0, "Corvane,SG200,100123,1.4.2\n2e9\n", ""},
      {"wavemill identify " + address, 0,
       "address       " + address +
           "\nidentity      Corvane,SG200,100123,1.4.2\nmanufacturer  Corvane\nmodel         SG200\n"
           "serial        100123\nfirmware      1.4.2\noptions       B10,B22,K20,K24\n",
       ""},
      {"wavemill scpi " + address + " --block up.bin \"MMEM:DATA 'w'\" --read-block down.bin \"MMEM:DATA? 'w'\"", 0, "",
       ""},
      {corvisa + "wavemill find", 0, "TCPIP0::127.0.0.1::inst0::INSTR\nASRL1::INSTR\n", ""},
      {corvisa + "wavemill find 'GPIB?*'", 1, "", "wavemill: no VISA resources match GPIB?* (wavemill find '?*' "},
      {"WAVEMILL_VISA_LIBRARY=/nonexistent/libvisa.so wavemill find", 1, "",
       "wavemill: no VISA resources found (is a VISA library installed? see WAVEMILL_VISA_LIBRARY)\n"},
      {"wavemill scpi -t 1000 " + closed + " '*IDN?'", 1, "", "wavemill: cannot connect to " + closed + "\n"},
      {"wavemill scpi -t 300 " + address + " 'FREQ 1e9' 'NOPE?'", 1, "",
       "wavemill: no answer to 'NOPE?' from " + address + " within 300 ms\n"},
      {"wavemill scpi " + address + " --block missing.bin 'MMEM:DATA \"w\"'", 1, "",
       "wavemill: cannot open missing.bin: No such file or directory\n"},
      {"wavemill scpi " + address, 2, "", "wavemill: COMMAND is required\n"},
      {"wavemill identify TCPIP0::127.0.0.1::99999999999::SOCKET", 2, "", "wavemill: not an instrument address: "},
      {"wavemill wv pack bad.csv out.wv", 1, "", "wavemill: bad.csv:4: not a number: 'x'\n"},
      {"wavemill wv pack loud.csv out.wv", 1, "", "wavemill: loud.csv:2: value outside -1..1 (use --normalize"},
      {"wavemill wv pack good.csv out.wv -m short.mkr", 1, "", "wavemill: short.mkr holds fewer marker values"},
      {"wavemill wv pack good.csv no/such/folder/out.wv", 1, "", "wavemill: cannot create no/such/folder/out.wv: "},
      {"wavemill wv info good.csv", 1, "", "wavemill: good.csv is not a waveform file\n"},
      {"wavemill frobnicate", 2, "", "wavemill: 'frobnicate' is no wavemill command\n"},
  };
  TempDir dir;
  writeAll(dir.path("good.csv"), "I,Q\n0.5,0.25\n-1,1\n");
  writeAll(dir.path("bad.csv"), "0.5,0.25\n\n0.1,0.2\n0.3,x\n");
  writeAll(dir.path("loud.csv"), "0.5,0.25\n1.5,0\n");
  writeAll(dir.path("short.mkr"), "1\n");
  std::string block;
  for (int n = 0; n < 300000; ++n)
    block += static_cast<char>((static_cast<unsigned>(n) * 7919U) >> 3);
  writeAll(dir.path("up.bin"), block);
  for (const auto &row : rows) {
    SCOPED_TRACE(row.commandLine);
    const Result result = run(dir, row.commandLine);
    EXPECT_EQ(result.code, row.code);
    EXPECT_EQ(result.out, row.out);
    if (row.err.empty())
      EXPECT_EQ(result.err, "");
    else
      EXPECT_EQ(result.err.rfind(row.err, 0), 0u) << result.err;
    EXPECT_FALSE(Tools::exist(dir.path("out.wv")) || Tools::exist(dir.path("out.wv.part")) ||
                 Tools::exist(dir.path("out.csv")));
  }
  const auto stored = simulator.getBlock("w");
  EXPECT_EQ(std::string(stored.begin(), stored.end()), block);
  EXPECT_EQ(readAll(dir.path("down.bin")), block);
  EXPECT_EQ(simulator.getValue("FREQ"), "1e9"); // the command before the failed query went through
}

} // namespace
} // namespace Corvane::Wavemill
