#include "support/LgsDebug.h"

#include <cstdio>
#include <cstdlib>
#include <mutex>

#include "support/DstringList.h"

namespace {

struct TraceConfig {
  DstringList categories;
  bool all = false;
  std::function<void(const Dstring&)> sink;
};

TraceConfig& Config() {
  static TraceConfig config = [] {
    TraceConfig c;
    const char* env = std::getenv("QEN_TRACE");
    c.categories = DstringList::Split(env ? env : "", ',');
    c.all = c.categories.Contains("all");
    return c;
  }();
  return config;
}

bool AnyOn(std::string_view categories) {
  const TraceConfig& c = Config();
  if (c.all) return true;
  if (c.categories.empty()) return false;
  for (const auto& category : DstringList::Split(categories, ',')) {
    if (c.categories.Contains(category)) return true;
  }
  return false;
}

}  // namespace

LgsDebug::LgsDebug(std::string_view name, std::string_view categories) : mOn(AnyOn(categories)) {
  if (mOn) mName = Dstring(name);
}

void LgsDebug::Printf(const char* format, ...) {
  if (!mOn) return;
  va_list args;
  va_start(args, format);
  Dstring line;
  line.VPrintf(format, args);
  va_end(args);
  line.insert(0, mName);
  const auto& sink = Config().sink;
  if (sink) {
    sink(line);
  } else {
    std::fputs(line.c_str(), stderr);
  }
}

void LgsDebug::SetCategories(std::string_view categories) {
  TraceConfig& c = Config();
  c.categories = DstringList::Split(categories, ',');
  c.all = c.categories.Contains("all");
}

void LgsDebug::SetSink(std::function<void(const Dstring&)> sink) { Config().sink = std::move(sink); }
