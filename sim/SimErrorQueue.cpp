#include "SimErrorQueue.h"

namespace {

Dstring Entry(int code, const Dstring& text) {
  return Dstring::Format("%d,\"%s\"", code, text.c_str());
}

}  // namespace

void SimErrorQueue::Push(int code, const Dstring& text) {
  if (mEntries.size() < kCapacity) {
    mEntries.push_back(Entry(code, text));
    return;
  }
  mEntries.back() = Entry(-350, "Queue overflow");
}

Dstring SimErrorQueue::Pop() {
  if (mEntries.empty()) return "0,\"No error\"";
  Dstring oldest = std::move(mEntries.front());
  mEntries.pop_front();
  return oldest;
}
