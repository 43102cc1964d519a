#include "core/ErrorJournal.h"

#include <ctime>

#include "instrument/QenGuiInst.h"

std::deque<ErrorJournal::Entry> ErrorJournal::mEntries;
std::function<void()> ErrorJournal::mListener;

void ErrorJournal::Install() { QenGuiInst::SetErrorListener(&ErrorJournal::Add); }

void ErrorJournal::Uninstall() { QenGuiInst::SetErrorListener(nullptr); }

void ErrorJournal::Add(const Dstring& command, const Condition& condition) {
  const std::time_t now = std::time(nullptr);
  char stamp[16];
  std::strftime(stamp, sizeof stamp, "%H:%M:%S", std::localtime(&now));
  mEntries.push_front({stamp, condition.GetCode(), condition.GetMessage(), command});
  if (mEntries.size() > kMaxEntries) mEntries.pop_back();
  if (mListener) mListener();
}

void ErrorJournal::Clear() {
  mEntries.clear();
  if (mListener) mListener();
}
