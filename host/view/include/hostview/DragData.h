#pragma once
// What a drag of instruments between views carries, for every view of the
// terminal (its own and the add-on's): the JSON link text, and the name of
// the dragging view's kind or class ("price view", "CInsExpViewEx"), which the
// target's EnableDropIn decides on.
namespace hv::drag {

// The JSON link text as UTF-8.
inline constexpr const char* kLinkMimeType = "application/x-marketviews-link";
// The source's kind or class name, ASCII.
inline constexpr const char* kSourceMimeType = "application/x-marketviews-source";

}  // namespace hv::drag
