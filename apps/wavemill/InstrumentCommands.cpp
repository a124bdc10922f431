#include "Commands.h"
#include "Files.h"
#include "Progress.h"
#include "Text.h"
#include "ToolError.h"

#include "wavemill/instrument/HardwareResource.h"
#include "wavemill/instrument/Instrument.h"
#include "wavemill/instrument/InstrumentIOSession.h"
#include "wavemill/instrument/VisaIOSession.h"
#include "wavemill/tools/Exceptions.h"

#include <climits>
#include <functional>
#include <iostream>
#include <memory>
#include <stdexcept>
#include <vector>

namespace Corvane::Wavemill::Cli {

namespace {

constexpr std::size_t blockPiece = 64 * 1024;

// A query is a command whose header, the first word, ends in "?": "*IDN?",
// "FREQ? MAX", "MMEM:DATA? 'w'".
bool isQuery(const std::string &command) {
  const std::string_view header = std::string_view(command).substr(0, command.find(' '));
  return !header.empty() && header.back() == '?';
}

std::string withoutLineEnds(std::string text) {
  while (!text.empty() && (text.back() == '\n' || text.back() == '\r'))
    text.pop_back();
  return text;
}

// The text before "#" of a block: a bare header gets a blank, a header with
// parameters a comma ("MMEM:DATA 'w'" -> "MMEM:DATA 'w',").
std::string blockPrefix(const std::string &command) {
  const std::string trimmed(trim(command));
  if (trimmed.find(' ') == std::string::npos)
    return trimmed + " ";
  return trimmed.back() == ',' ? trimmed : trimmed + ",";
}

// One connection to an instrument through whichever session its address
// calls for; every failure becomes one line that names the address.
class Connection {
public:
  Connection(const std::string &address, int timeoutMs) : address(address), timeoutMs(timeoutMs) {
    try {
      session = InstrumentIOSession::create(address);
    } catch (const std::exception &) {
      throw UsageError("not an instrument address: " + address);
    }
    if (session == nullptr)
      throw UsageError("the instrument address is empty");
    session->setTimeoutInMS(timeoutMs);
    if (!session->connect())
      throw ToolError("cannot connect to " + address);
  }
  ~Connection() { session->close(); }
  Connection(const Connection &) = delete;
  Connection &operator=(const Connection &) = delete;

  void send(const std::string &command) {
    guarded("cannot send '" + command + "' to " + address, [&] { session->writeLine(command); });
  }

  std::string query(const std::string &command) {
    send(command);
    std::string answer;
    guarded("cannot read the answer to '" + command + "' from " + address,
            [&] { answer = withoutLineEnds(session->readLine()); });
    if (answer.empty())
      throw ToolError("no answer to '" + command + "' from " + address + " within " + formatNumber(timeoutMs) + " ms");
    return answer;
  }

  void sendBlock(const std::string &command, const std::string &path, bool quiet) {
    InputFile file(path);
    const std::int64_t size = file.size();
    if (size < 0 || size > INT_MAX)
      throw ToolError("cannot send " + path + ": a block holds at most " + formatNumber(INT_MAX) + " bytes");
    std::vector<unsigned char> piece(blockPiece);
    std::size_t got = file.read(piece.data(), piece.size());
    const std::string context = "cannot send " + path + " to " + address;
    guarded(context, [&] {
      session->writeManyBlocksStart(blockPrefix(command), gsl::span<unsigned char>(piece.data(), got),
                                    static_cast<int>(size));
    });
    Progress progress("sending", size, Progress::wanted(quiet));
    std::int64_t sent = static_cast<std::int64_t>(got);
    while ((got = file.read(piece.data(), piece.size())) > 0) {
      guarded(context, [&] { session->writeManyBlocks(gsl::span<unsigned char>(piece.data(), got)); });
      sent += static_cast<std::int64_t>(got);
      progress.update(sent);
    }
    if (sent != size)
      throw ToolError(context + ": the file changed while it was sent");
    guarded(context, [&] { session->writeManyBlocksEnd(); });
  }

  std::vector<unsigned char> readBlock(const std::string &command) {
    std::vector<unsigned char> block;
    const std::string context = "cannot read a block in answer to '" + command + "' from " + address;
    guarded(context, [&] { block = session->readBlock(command); });
    // A failed transfer closes a socket session; an empty block keeps it.
    if (block.empty() && !session->getConnected())
      throw ToolError(context + " within " + formatNumber(timeoutMs) + " ms");
    return block;
  }

private:
  // Sessions report a lost connection by throwing or, on a socket, by
  // clearing their connected flag; both end the command here.
  void guarded(const std::string &context, const std::function<void()> &call) {
    try {
      call();
    } catch (const InstrumentException &) {
      throw ToolError(context + ": the connection was lost");
    } catch (const ApplicationException &error) {
      // The VISA layer's own description of the failure.
      throw ToolError(context + ": " + std::string(trim(error.getMessage())));
    } catch (const std::exception &) {
      throw ToolError(context);
    }
    if (!session->getConnected())
      throw ToolError(context + ": the connection was closed");
  }

  std::string address;
  int timeoutMs;
  std::shared_ptr<InstrumentIOSession> session;
};

// Asks the device for its options: an Instrument leaves that to derived
// classes, since not every device answers "*OPT?".
class QueriedInstrument : public Instrument {
public:
  QueriedInstrument(const std::string &address, int timeout) : Instrument(address) { timeoutInMS = timeout; }
  std::string getOptions() override {
    try {
      return query("*OPT?", -1);
    } catch (const std::exception &) {
      return ""; // an instrument without options still identifies
    }
  }
};

} // namespace

int runScpi(const ScpiOptions &options) {
  if (options.timeoutMs <= 0)
    throw UsageError("--timeout must be above 0 ms");
  std::size_t blockCommand = options.commands.size();
  std::size_t blockQuery = options.commands.size();
  for (std::size_t n = 0; n < options.commands.size(); ++n)
    (isQuery(options.commands[n]) ? blockQuery : blockCommand) = n;
  if (!options.block.empty() && blockCommand == options.commands.size())
    throw UsageError("--block needs a command that is no query to send the block after");
  if (!options.readBlock.empty() && blockQuery == options.commands.size())
    throw UsageError("--read-block needs a query whose answer is the block");

  Connection connection(options.address, options.timeoutMs);
  for (std::size_t n = 0; n < options.commands.size(); ++n) {
    const std::string &command = options.commands[n];
    if (n == blockCommand && !options.block.empty()) {
      connection.sendBlock(command, options.block, options.quiet);
    } else if (n == blockQuery && !options.readBlock.empty()) {
      OutputFile out(options.readBlock);
      const auto block = connection.readBlock(command);
      out.write(block.data(), block.size());
      out.commit();
    } else if (isQuery(command)) {
      std::cout << connection.query(command) << '\n' << std::flush;
    } else {
      connection.send(command);
    }
  }
  return 0;
}

int runIdentify(const IdentifyOptions &options) {
  if (options.timeoutMs <= 0)
    throw UsageError("--timeout must be above 0 ms");
  std::shared_ptr<QueriedInstrument> instrument;
  try {
    instrument = std::make_shared<QueriedInstrument>(options.address, options.timeoutMs);
  } catch (const std::exception &) {
    throw UsageError("not an instrument address: " + options.address);
  }
  auto resource = instrument->getHardwareResource();
  try {
    resource->updateConnection(instrument);
  } catch (const std::exception &error) {
    if (options.address.empty())
      throw UsageError("the instrument address is empty");
    // A session that never opened reads "Failed to send SCPI ..."; anything
    // else went wrong on the line.
    if (std::string(error.what()).rfind("Failed to send", 0) == 0)
      throw ToolError("cannot connect to " + options.address);
    throw ToolError("no answer to '*IDN?' from " + options.address);
  }
  if (resource->getIdentity().empty())
    throw ToolError("no answer to '*IDN?' from " + options.address + " within " + formatNumber(options.timeoutMs) +
                    " ms");

  const std::pair<const char *, std::string> fields[] = {
      {"address", options.address},
      {"identity", resource->getIdentity()},
      {"manufacturer", resource->getManufacturer()},
      {"model", resource->getModelNumber()},
      {"serial", resource->getSerialNumber()},
      {"firmware", resource->getFirmwareRevision()},
      {"options", resource->getOptions()},
  };
  std::string out;
  if (options.json) {
    const char *separator = "{\n";
    for (const auto &[name, value] : fields) {
      out += separator + std::string("  ") + jsonString(name) + ": " + jsonString(value);
      separator = ",\n";
    }
    out += "\n}\n";
  } else {
    for (const auto &[name, value] : fields)
      out += name + std::string(14 - std::string(name).size(), ' ') + value + "\n";
  }
  std::cout << out << std::flush;
  return 0;
}

int runFind(const FindOptions &options) {
  const auto found = VisaIOSession::discover(options.expression);
  if (found.empty()) {
    if (!VisaIOSession::discover("?*").empty())
      throw ToolError("no VISA resources match " + options.expression + " (wavemill find '?*' lists them all)");
    throw ToolError("no VISA resources found (is a VISA library installed? see WAVEMILL_VISA_LIBRARY)");
  }
  for (const auto &resource : found)
    std::cout << resource << '\n';
  std::cout << std::flush;
  return 0;
}

} // namespace Corvane::Wavemill::Cli
