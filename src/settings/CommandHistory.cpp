#include "settings/CommandHistory.h"

#include "settings/QENRegistryProfile.h"
#include "settings/RegistryStore.h"
#include "support/DataParcel.h"

namespace {

constexpr const char* kValueName = "History";

Dstring Key() { return Dstring(QENRegistryProfile::kGuiKey) + "\\CommandWindow"; }

}  // namespace

int CommandHistory::Read(ConditionList& list) {
  void* root = RegistryStore::CurrentUser();
  int exists = 0;
  if (int status = QENRegistryProfile::Exists(root, Key(), kValueName, exists, list)) return status;
  mLines.clear();
  if (exists) {
    DataParcel items;
    if (int status = QENRegistryProfile::GetValue(root, Key(), kValueName, items, list)) return status;
    for (const DataItem& item : items) {
      if (item.IsText()) mLines.push_back(Dstring(item.GetText()));
    }
  }
  mCursor = mLines.size();
  return 0;
}

int CommandHistory::Write(ConditionList& list) const {
  DataParcel items;
  for (const Dstring& line : mLines) items.push_back(DataItem::MakeString(line));
  return QENRegistryProfile::SetValue(RegistryStore::CurrentUser(), Key(), kValueName, items, list);
}

void CommandHistory::Add(const Dstring& line) {
  if (!line.empty() && (mLines.empty() || mLines.back() != line)) mLines.push_back(line);
  if (mLines.size() > kLength) mLines.erase(mLines.begin(), mLines.begin() + static_cast<long>(mLines.size() - kLength));
  mCursor = mLines.size();
  mBegun.clear();
}

Dstring CommandHistory::Previous(const Dstring& current) {
  if (mCursor == mLines.size()) mBegun = current;
  if (mCursor > 0) --mCursor;
  return mLines.empty() ? current : mLines[mCursor];
}

Dstring CommandHistory::Next() {
  if (mCursor < mLines.size()) ++mCursor;
  return mCursor == mLines.size() ? mBegun : mLines[mCursor];
}
