#pragma once
// How the data word of a synchronous answer becomes a typed value, for
// CAddonView::Ask<T>. The word is read while the answer is being delivered
// (pointers in it die with the call), so the value is a copy.
//
//   HostAnswer<LPARAM>   the word itself as a number (519, 604, 2310 answers);
//   HostAnswer<T>        the word points at a T (a text, a record, a list):
//                        a copy; a null word is no answer (550/551 "no such
//                        instrument").
#include <optional>

#include "hostview/Types.h"

namespace addon {

template <class T>
struct HostAnswer {
  static std::optional<T> Read(LPARAM word) {
    if (word == 0) return std::nullopt;
    return *FromLParam<const T>(word);
  }
};

template <>
struct HostAnswer<LPARAM> {
  static std::optional<LPARAM> Read(LPARAM word) { return word; }
};

}  // namespace addon
