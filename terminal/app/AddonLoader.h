#pragma once
// Loads the market views add-on with dlopen and resolves its one entry point.
// The terminal knows the add-on only through that entry and the base view contract.
#include <string>

struct CRuntimeClass;

namespace term {

class AddonLoader {
 public:
  using EntryFn = CRuntimeClass* (*)(const char* className);
  static constexpr const char* kEntryName = "GetBaseViewPointer";
  static constexpr const char* kLibraryName = "libmarketviews.so";

  AddonLoader() = default;
  ~AddonLoader();
  AddonLoader(const AddonLoader&) = delete;
  AddonLoader& operator=(const AddonLoader&) = delete;

  // <dir of the executable>/../lib/libmarketviews.so, then next to the executable.
  static std::string DefaultPath();

  // False with a message naming the path and the reason when the library
  // cannot be loaded or lacks the entry point.
  bool Load(const std::string& path, std::string& error);
  bool IsLoaded() const { return m_entry != nullptr; }
  const std::string& Path() const { return m_path; }

  // The add-on's descriptor for a class name; null for names it does not know.
  const CRuntimeClass* Find(const std::string& className) const;

  // The library stays loaded for the life of the process: views created from it
  // may still be alive when the loader goes away, and unloading Qt plugins and
  // their statics mid-exit is a classic crash.
  void* Handle() const { return m_handle; }

 private:
  void* m_handle = nullptr;
  EntryFn m_entry = nullptr;
  std::string m_path;
};

}  // namespace term
