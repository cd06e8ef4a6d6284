// The library entry: the one exported function. The classes it hands out are
// the registry of addon/ViewClasses.h.
#include <cstring>

#include "addon/ViewClasses.h"
#include "hostview/SuperBaseView.h"

// The descriptor of the view class `className`; null for a null, empty or
// unknown name. Names match exactly (case-sensitive), in the registry's
// order. The descriptors live as long as the library.
extern "C" __attribute__((visibility("default"))) const CRuntimeClass* GetBaseViewPointer(const char* className) {
  if (!className || !*className) return nullptr;
  for (const addon::ViewClassInfo* info : addon::ViewClasses())
    if (std::strcmp(info->className, className) == 0) return info->descriptor;
  return nullptr;
}
