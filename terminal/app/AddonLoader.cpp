#include "terminal/app/AddonLoader.h"

#include <dlfcn.h>

#include <filesystem>
#include <system_error>

#include "hostview/SuperBaseView.h"

namespace term {

namespace fs = std::filesystem;

AddonLoader::~AddonLoader() = default;

std::string AddonLoader::DefaultPath() {
  std::error_code ec;
  const fs::path exe = fs::read_symlink("/proc/self/exe", ec);
  if (ec) return kLibraryName;
  const fs::path dir = exe.parent_path();
  const fs::path lib = dir.parent_path() / "lib" / kLibraryName;
  if (fs::exists(lib)) return lib.string();
  const fs::path beside = dir / kLibraryName;
  if (fs::exists(beside)) return beside.string();
  return lib.string();  // named in the error message when it is missing
}

bool AddonLoader::Load(const std::string& path, std::string& error) {
  m_path = path;
  std::error_code ec;
  if (path.find('/') != std::string::npos && !fs::exists(path, ec)) {
    error = "cannot load the add-on " + path + ": no such file (build it, or name it with --addon PATH)";
    return false;
  }
  dlerror();
  void* handle = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (!handle) {
    const char* why = dlerror();
    error = "cannot load the add-on " + path + ": " + (why ? why : "unknown reason");
    return false;
  }
  dlerror();
  void* sym = dlsym(handle, kEntryName);
  if (!sym) {
    error = "the add-on " + path + " has no " + kEntryName + " entry point; it is not a market views add-on";
    dlclose(handle);
    return false;
  }
  m_handle = handle;
  m_entry = reinterpret_cast<EntryFn>(sym);
  return true;
}

const CRuntimeClass* AddonLoader::Find(const std::string& className) const {
  if (!m_entry || className.empty()) return nullptr;
  const CRuntimeClass* rc = m_entry(className.c_str());
  // A descriptor that cannot create anything is as good as none.
  return rc && rc->m_pfnCreateObject ? rc : nullptr;
}

}  // namespace term
