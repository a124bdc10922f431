#include "wavemill/instrument/WSAClass.h"
#include "wavemill/tools/Tools.h"

#include "platform/Icmp.h"
#include "platform/Network.h"
#include "platform/Process.h"

#include <regex>
#include <sstream>
#include <thread>

namespace Corvane::Wavemill {

int Tools::getCurrentProcessId() { return Platform::currentProcessId(); }

std::uint64_t Tools::getCurrentThreadId() {
  std::ostringstream text;
  text << std::this_thread::get_id();
  std::istringstream reader(text.str());
  std::uint64_t id = 0;
  reader >> id;
  return id;
}

std::vector<int> Tools::enumProcesses() { return Platform::processIds(); }

bool Tools::isRunning(int pid) { return Platform::isProcessRunning(pid); }

bool Tools::killProcess(int pid, int /*timeoutInMS*/) { return Platform::terminateProcess(pid); }

int Tools::startProcess(const std::string &commandLine, int timeoutInMS) {
  int pid = 0;
  if (const int error = Platform::spawnProcess(commandLine, pid); error != 0)
    return error;
  // How the program ended is its own affair: it started, and that is all the
  // result tells. One that outlasts the wait is reaped later, at the next start
  // or when isRunning finds it ended.
  int exitStatus = 0;
  if (!Platform::waitProcess(pid, timeoutInMS, exitStatus))
    Platform::abandonProcess(pid);
  return 0;
}

int Tools::getParentProcessId(int pid) { return Platform::parentProcessId(pid); }

std::string Tools::getHostname() { return Platform::hostName(); }

bool Tools::ping(const std::string &host, int timeoutInMS) {
  if (host.empty())
    return false;
  const WSAClass sockets;
  if (!sockets.isStarted())
    return false;
  // The blank after the second number is intended: only such text counts as
  // an address as it stands, a plain dotted address goes through the look-up.
  static const std::regex dotted("^\\d+\\.\\d +\\.\\d+\\.\\d+$");
  const std::string address = std::regex_match(host, dotted) ? host : Platform::resolveIPv4(host);
  if (address.empty())
    return false;
  return Platform::sendEcho(address, timeoutInMS);
}

} // namespace Corvane::Wavemill
