#pragma once

#include <functional>
#include <string_view>

#include "support/Dstring.h"

// A trace scope: the qualified name of the traced operation and its categories
// ("qenguiinst,traffic"). Lines are written only when one of the categories is switched on
// by QEN_TRACE (a comma-separated list, or "all"); otherwise a scope costs one lookup.
class LgsDebug {
 public:
  LgsDebug(std::string_view name, std::string_view categories);

  bool IsOn() const { return mOn; }
  // Writes "<name><text>" when the scope is on.
  void Printf(const char* format, ...) __attribute__((format(printf, 2, 3)));

  // Replaces the QEN_TRACE setting (tests, command-line options).
  static void SetCategories(std::string_view categories);
  // Where lines go; standard error when unset.
  static void SetSink(std::function<void(const Dstring&)> sink);

 private:
  Dstring mName;
  bool mOn;
};
