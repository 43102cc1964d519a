#include "toolkit/qt/StatusNotice.h"

namespace {

StatusNotice::Sink& Installed() {
  static StatusNotice::Sink sink;
  return sink;
}

}  // namespace

void StatusNotice::Install(Sink sink) { Installed() = std::move(sink); }

void StatusNotice::Show(const QString& text) {
  if (Installed()) Installed()(text);
}
