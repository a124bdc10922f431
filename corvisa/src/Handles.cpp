#include "Handles.h"

#include <utility>

namespace Corvane::Wavemill::CorVisa {

Handles &Handles::instance() {
  // Never destroyed: a client thread may still call in while the process exits.
  static auto *handles = new Handles;
  return *handles;
}

ViObject Handles::add(Entry entry) {
  // Called with the lock held. The table is small, so looking for a free
  // number after a wrap ends soon.
  do {
    ++lastHandle;
  } while (lastHandle == VI_NULL || entries.count(lastHandle) != 0);
  entries.emplace(lastHandle, std::move(entry));
  return lastHandle;
}

ViSession Handles::addManager() {
  std::lock_guard<std::mutex> lock(mutex);
  return add(Entry{Kind::Manager, VI_NULL, nullptr, {}, 0});
}

ViStatus Handles::addSession(ViSession manager, std::shared_ptr<Session> session, ViSession &handle) {
  std::lock_guard<std::mutex> lock(mutex);
  // The manager may have been closed by another thread while connecting.
  const auto found = entries.find(manager);
  if (found == entries.end() || found->second.kind != Kind::Manager)
    return VI_ERROR_INV_OBJECT;
  handle = add(Entry{Kind::Session, manager, std::move(session), {}, 0});
  return VI_SUCCESS;
}

ViStatus Handles::addFindList(ViSession manager, std::vector<std::string> found, ViFindList &handle) {
  std::lock_guard<std::mutex> lock(mutex);
  const auto entry = entries.find(manager);
  if (entry == entries.end() || entry->second.kind != Kind::Manager)
    return VI_ERROR_INV_OBJECT;
  // The first match went out with viFindRsrc.
  handle = add(Entry{Kind::FindList, manager, nullptr, std::move(found), 1});
  return VI_SUCCESS;
}

bool Handles::isManager(ViObject handle) {
  std::lock_guard<std::mutex> lock(mutex);
  const auto found = entries.find(handle);
  return found != entries.end() && found->second.kind == Kind::Manager;
}

bool Handles::isOpen(ViObject handle) {
  std::lock_guard<std::mutex> lock(mutex);
  return entries.count(handle) != 0;
}

std::shared_ptr<Session> Handles::session(ViObject handle) {
  std::lock_guard<std::mutex> lock(mutex);
  const auto found = entries.find(handle);
  if (found == entries.end() || found->second.kind != Kind::Session)
    return nullptr;
  return found->second.session;
}

ViStatus Handles::nextFound(ViFindList handle, std::string &found) {
  std::lock_guard<std::mutex> lock(mutex);
  const auto entry = entries.find(handle);
  if (entry == entries.end() || entry->second.kind != Kind::FindList)
    return VI_ERROR_INV_OBJECT;
  auto &list = entry->second;
  if (list.next >= list.found.size())
    return VI_ERROR_RSRC_NFOUND;
  found = list.found[list.next++];
  return VI_SUCCESS;
}

ViStatus Handles::close(ViObject handle) {
  std::vector<std::shared_ptr<Session>> closing;
  {
    std::lock_guard<std::mutex> lock(mutex);
    const auto found = entries.find(handle);
    if (found == entries.end())
      return VI_ERROR_INV_OBJECT;
    if (found->second.kind == Kind::Manager) {
      for (auto entry = entries.begin(); entry != entries.end();) {
        if (entry->second.manager == handle) {
          if (entry->second.session)
            closing.push_back(entry->second.session);
          entry = entries.erase(entry);
        } else {
          ++entry;
        }
      }
    }
    if (found->second.session)
      closing.push_back(found->second.session);
    entries.erase(found);
  }
  // Outside the lock: a shutdown wakes a thread that waits in a read, and
  // the last owner closes the socket when that thread lets go.
  for (const auto &session : closing)
    session->shutdown();
  return VI_SUCCESS;
}

} // namespace Corvane::Wavemill::CorVisa
