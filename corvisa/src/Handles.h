#pragma once

#include "Session.h"
#include "corvisa/corvisa.h"

#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace Corvane::Wavemill::CorVisa {

// The table of open handles: resource managers, the sessions and find lists
// opened through them. Handles are small numbers, never 0 (VI_NULL), and a
// closed one is not given out again until the numbers wrap. Thread-safe:
// one mutex guards the table; sessions are handed out as shared pointers,
// so a session's I/O runs outside the table's lock and a close from another
// thread only wakes it.
class Handles {
public:
  // The one table of the process.
  static Handles &instance();

  ViSession addManager();
  // VI_ERROR_INV_OBJECT when `manager` is not an open resource manager.
  ViStatus addSession(ViSession manager, std::shared_ptr<Session> session, ViSession &handle);
  ViStatus addFindList(ViSession manager, std::vector<std::string> found, ViFindList &handle);

  bool isManager(ViObject handle);
  // Whether `handle` is open, whatever its kind.
  bool isOpen(ViObject handle);
  // The session behind `handle`; null when it is no open session.
  std::shared_ptr<Session> session(ViObject handle);
  // The next entry of a find list: VI_ERROR_INV_OBJECT when `handle` is no
  // find list, VI_ERROR_RSRC_NFOUND past its end.
  ViStatus nextFound(ViFindList handle, std::string &found);
  // Closes `handle`, and for a resource manager everything opened through it.
  ViStatus close(ViObject handle);

private:
  enum class Kind { Manager, Session, FindList };
  struct Entry {
    Kind kind;
    ViSession manager = VI_NULL;
    std::shared_ptr<Session> session;
    std::vector<std::string> found;
    std::size_t next = 0;
  };

  ViObject add(Entry entry);

  std::mutex mutex;
  std::map<ViObject, Entry> entries;
  ViObject lastHandle = 0;
};

} // namespace Corvane::Wavemill::CorVisa
