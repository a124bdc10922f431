// wavemill: the command-line tool of the Wavemill library. It packs and
// unpacks waveform files and talks SCPI to instruments.
//
//   wavemill wv info|pack|unpack ...   waveform files
//   wavemill scpi ADDRESS COMMAND...   commands and queries
//   wavemill identify ADDRESS          identity and options
//   wavemill find [EXPRESSION]         VISA resources
//   wavemill sim                       a simulated instrument
//
// Exit codes: 0 success, 1 a failed operation, 2 a wrong command line.
#include "Commands.h"
#include "ToolError.h"

#include <CLI/CLI.hpp>

#include <iostream>
#include <new>

using namespace Corvane::Wavemill::Cli;

namespace {

constexpr int failedOperation = 1;
constexpr int wrongUsage = 2;

const char *const formatHelp = "sample data: csv (lines I,Q[,marker bits]) or interleaved little-endian IQ "
                               "as f32, f64 or i16";

// The full name of the deepest subcommand the user got to: "wavemill wv pack".
std::string commandName(CLI::App &app) {
  std::string name = app.get_name();
  CLI::App *current = &app;
  while (!current->get_subcommands().empty()) {
    current = current->get_subcommands().front();
    name += " " + current->get_name();
  }
  return name;
}

void addWaveformCommands(CLI::App &app, InfoOptions &info, PackOptions &pack, UnpackOptions &unpack,
                         std::string &packFormat, std::string &unpackFormat) {
  auto *wv = app.add_subcommand("wv", "Pack, unpack and inspect waveform files");
  wv->require_subcommand(1);

  auto *infoCommand = wv->add_subcommand("info", "Print the sample count, format, markers and header fields of FILE");
  infoCommand->add_option("FILE", info.file, "waveform file")->required();
  infoCommand->add_flag("--json", info.json, "print JSON instead of aligned text");
  infoCommand->callback([&] { runInfo(info); });

  auto *packCommand = wv->add_subcommand("pack", "Make the waveform file OUT from the sample data IN");
  packCommand->add_option("IN", pack.input, "sample data; - reads standard input")->required();
  packCommand->add_option("OUT", pack.output, "waveform file to write")->required();
  packCommand->add_option("-f,--format", packFormat, formatHelp)
      ->check(CLI::IsMember({"csv", "f32", "f64", "i16"}))
      ->default_str("csv");
  packCommand->add_flag("-n,--normalize", pack.normalize,
                        "scale by the peak of I and Q to full scale (default: take values as they are: "
                        "-1..1, or the codes of i16)");
  packCommand->add_flag("--float", pack.floatIq, "store float32 IQ instead of 16-bit integers");
  packCommand->add_option("-m,--markers", pack.markers, "text file of marker bits, one value 0-15 a line");
  packCommand->add_option("-s,--set", pack.fields, "header field, name=value (names as wv info prints them)")
      ->allow_extra_args(false);
  packCommand->add_flag("-q,--quiet", pack.quiet, "no progress bar");
  packCommand->footer("Example: wavemill wv pack tone.csv tone.wv --set tag5=tone");
  packCommand->callback([&] {
    parseSampleFormat(packFormat, pack.format);
    runPack(pack);
  });

  auto *unpackCommand = wv->add_subcommand("unpack", "Write the samples of the waveform file FILE to OUT");
  unpackCommand->add_option("FILE", unpack.input, "waveform file")->required();
  unpackCommand->add_option("OUT", unpack.output, "sample data; - writes standard output")->required();
  unpackCommand->add_option("-f,--format", unpackFormat, formatHelp)
      ->check(CLI::IsMember({"csv", "f32", "f64", "i16"}))
      ->default_str("csv");
  unpackCommand->add_option("-m,--markers", unpack.markers,
                            "write the marker bits to this text file (CSV has them as a third column otherwise)");
  unpackCommand->add_flag("-q,--quiet", unpack.quiet, "no progress bar");
  unpackCommand->callback([&] {
    parseSampleFormat(unpackFormat, unpack.format);
    runUnpack(unpack);
  });
}

void addInstrumentCommands(CLI::App &app, ScpiOptions &scpi, IdentifyOptions &identify, FindOptions &find,
                           SimOptions &sim) {
  const char *addressHelp = "instrument address: host, TCPIP0::host::port::SOCKET or any VISA resource";

  auto *scpiCommand =
      app.add_subcommand("scpi", "Send SCPI commands; print the answer of each query (a header ending in ?)");
  scpiCommand->add_option("ADDRESS", scpi.address, addressHelp)->required();
  scpiCommand->add_option("COMMAND", scpi.commands, "commands, sent in order")->required();
  scpiCommand->add_option("-t,--timeout", scpi.timeoutMs, "time-out of each transfer in ms")->default_val(10000);
  scpiCommand->add_option("--block", scpi.block,
                          "send this file as a definite-length block after the last command that is no query");
  scpiCommand->add_option("--read-block", scpi.readBlock, "save the block answering the last query to this file");
  scpiCommand->add_flag("-q,--quiet", scpi.quiet, "no progress bar");
  scpiCommand->footer("Example: wavemill scpi 192.168.0.5 '*RST' 'FREQ 1e9' 'FREQ?'");
  scpiCommand->callback([&] { runScpi(scpi); });

  auto *identifyCommand = app.add_subcommand("identify", "Print the identity and options of an instrument");
  identifyCommand->add_option("ADDRESS", identify.address, addressHelp)->required();
  identifyCommand->add_option("-t,--timeout", identify.timeoutMs, "time-out of each transfer in ms")
      ->default_val(10000);
  identifyCommand->add_flag("--json", identify.json, "print JSON instead of aligned text");
  identifyCommand->callback([&] { runIdentify(identify); });

  auto *findCommand = app.add_subcommand("find", "List the VISA resources that match EXPRESSION");
  findCommand->add_option("EXPRESSION", find.expression, "VISA pattern: ? one character, * any run")
      ->default_str("?*INSTR");
  findCommand->callback([&] { runFind(find); });

  auto *simCommand = app.add_subcommand("sim", "Run a simulated SCPI instrument on 127.0.0.1 until Ctrl-C");
  simCommand->add_option("-p,--port", sim.port, "TCP port, 0 picks a free one")
      ->check(CLI::Range(0, 65535))
      ->default_val(5025);
  simCommand->add_option("--idn", sim.identity, "answer to *IDN?");
  simCommand->add_option("--options", sim.options, "answer to *OPT?");
  simCommand
      ->add_option("--fault", sim.fault,
                   "none, stall, close-mid-block, garbage-block, trickle, short-block, no-terminator, refuse")
      ->default_val("none");
  simCommand->callback([&] { runSim(sim); });
}

} // namespace

int main(int argc, char **argv) {
  CLI::App app("Wavemill's tool: waveform files and SCPI instruments", "wavemill");
  app.set_version_flag("--version", WAVEMILL_VERSION);
  app.require_subcommand(1);
  app.footer("Run 'wavemill COMMAND --help' for the options of a command.");

  InfoOptions info;
  PackOptions pack;
  UnpackOptions unpack;
  std::string packFormat = "csv";
  std::string unpackFormat = "csv";
  ScpiOptions scpi;
  IdentifyOptions identify;
  FindOptions find;
  SimOptions sim;
  addWaveformCommands(app, info, pack, unpack, packFormat, unpackFormat);
  addInstrumentCommands(app, scpi, identify, find, sim);

  if (argc < 2) {
    std::cerr << app.help();
    return wrongUsage;
  }
  const std::string first = argv[1];
  if (first.front() != '-' &&
      app.get_subcommands([&](CLI::App *command) { return command->get_name() == first; }).empty()) {
    std::cerr << "wavemill: '" << first << "' is no wavemill command\nRun 'wavemill --help' for the commands.\n";
    return wrongUsage;
  }
  try {
    app.parse(argc, argv);
  } catch (const CLI::CallForHelp &help) {
    return app.exit(help);
  } catch (const CLI::CallForAllHelp &help) {
    return app.exit(help);
  } catch (const CLI::CallForVersion &version) {
    return app.exit(version);
  } catch (const CLI::ParseError &error) {
    std::cerr << "wavemill: " << error.what() << "\nRun '" << commandName(app) << " --help' for usage.\n";
    return wrongUsage;
  } catch (const UsageError &error) {
    std::cerr << "wavemill: " << error.what() << "\nRun '" << commandName(app) << " --help' for usage.\n";
    return wrongUsage;
  } catch (const ToolError &error) {
    std::cerr << "wavemill: " << error.what() << "\n";
    return failedOperation;
  } catch (const std::bad_alloc &) {
    std::cerr << "wavemill: out of memory\n";
    return failedOperation;
  } catch (const std::exception &error) {
    std::cerr << "wavemill: " << error.what() << "\n";
    return failedOperation;
  }
  return 0;
}
