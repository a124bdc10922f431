#include "platform/Module.h"

#include "platform/FileSystem.h"

#include <cerrno>
#include <string>
#include <vector>

#include <dlfcn.h>
#include <link.h>
#include <unistd.h>

namespace Corvane::Wavemill::Platform {

namespace {

int readLink(const std::string &link, std::size_t capacity, std::string &path) {
  if (capacity == 0) {
    return insufficientBuffer;
  }
  std::vector<char> buffer(capacity);
  const auto length = ::readlink(link.c_str(), buffer.data(), buffer.size());
  if (length < 0) {
    return errno;
  }
  // readlink fills the buffer without a terminating zero, so a full buffer
  // may hold a cut path.
  if (static_cast<std::size_t>(length) + 1 > capacity) {
    return insufficientBuffer;
  }
  path.assign(buffer.data(), static_cast<std::size_t>(length));
  return 0;
}

// The loader names a module by the path it was found under, which may be
// relative to the working directory of that moment; the main program has no
// name there at all.
int absoluteModulePath(const std::string &loaderName, std::size_t capacity, std::string &path) {
  if (loaderName.empty()) {
    return processImagePath(-1, capacity, path);
  }
  const auto absolute = fullPath(loaderName, 32767);
  if (absolute.empty()) {
    return ENOENT;
  }
  if (absolute.size() + 1 > capacity) {
    return insufficientBuffer;
  }
  path = absolute;
  return 0;
}

std::string fileNameOf(const std::string &path) {
  const auto slash = path.rfind('/');
  return slash == std::string::npos ? path : path.substr(slash + 1);
}

bool nameMatches(const std::string &name, const std::string &path) {
  if (name == path) {
    return true;
  }
  const auto file = fileNameOf(path);
  if (name == file) {
    return true;
  }
  // The ".so" that ends the name proper is followed by version numbers or
  // nothing; one inside a name ("libx.sockets.so") is not.
  for (auto so = file.find(".so"); so != std::string::npos; so = file.find(".so", so + 1)) {
    if (so + 3 == file.size() || file[so + 3] == '.') {
      const auto upToSo = file.substr(0, so + 3);
      return name == upToSo || "lib" + name + ".so" == upToSo;
    }
  }
  return false;
}

struct LoadedModules {
  std::vector<std::string> names;
  bool failed = false;
};

int collectModule(dl_phdr_info *info, std::size_t, void *data) {
  auto &modules = *static_cast<LoadedModules *>(data);
  // The loader holds a lock while it calls back; no exception may cross it.
  try {
    modules.names.emplace_back(info->dlpi_name == nullptr ? "" : info->dlpi_name);
    return 0;
  } catch (...) {
    modules.failed = true;
    return 1;
  }
}

} // namespace

int moduleFileNameOfAddress(const void *address, std::size_t capacity, std::string &path) {
  Dl_info info{};
  link_map *module = nullptr;
  if (address == nullptr || ::dladdr1(address, &info, reinterpret_cast<void **>(&module), RTLD_DL_LINKMAP) == 0 ||
      module == nullptr) {
    return ENOENT;
  }
  return absoluteModulePath(module->l_name == nullptr ? "" : module->l_name, capacity, path);
}

int moduleFileNameByName(const std::string &name, std::size_t capacity, std::string &path) {
  if (name.empty()) {
    return ENOENT;
  }
  LoadedModules modules;
  ::dl_iterate_phdr(collectModule, &modules);
  if (modules.failed) {
    return ENOMEM;
  }
  for (const auto &loaderName : modules.names) {
    // Names without a folder belong to modules without a file, such as the
    // kernel's vDSO.
    if (!loaderName.empty() && loaderName.find('/') == std::string::npos) {
      continue;
    }
    std::string candidate;
    if (absoluteModulePath(loaderName, 32767, candidate) != 0 || !nameMatches(name, candidate)) {
      continue;
    }
    if (candidate.size() + 1 > capacity) {
      return insufficientBuffer;
    }
    path = candidate;
    return 0;
  }
  return ENOENT;
}

int processImagePath(int pid, std::size_t capacity, std::string &path) {
  const auto process = pid < 0 ? std::string("self") : std::to_string(pid);
  return readLink("/proc/" + process + "/exe", capacity, path);
}

void *loadModule(const std::string &path, std::string &error) {
  void *module = ::dlopen(path.c_str(), RTLD_NOW | RTLD_GLOBAL | RTLD_NODELETE);
  if (module == nullptr) {
    const char *message = ::dlerror();
    error = message == nullptr ? "cannot load " + path : message;
  }
  return module;
}

void *moduleSymbol(void *module, const char *name) {
  if (module == nullptr || name == nullptr)
    return nullptr;
  return ::dlsym(module, name);
}

} // namespace Corvane::Wavemill::Platform
