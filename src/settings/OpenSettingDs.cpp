#include "settings/OpenSettingDs.h"

#include <cctype>
#include <random>

#include "instrument/AppHandle.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "settings/QENSystemProfile.h"
#include "settings/SettingFile.h"
#include "settings/SettingMRU.h"
#include "settings/SettingsStatus.h"
#include "settings/StartUpConfig.h"
#include "support/ConditionListLoader.h"
#include "support/DstringList.h"
#include "support/FWBlocker.h"
#include "support/LgsDebug.h"

namespace {

constexpr const char* kName = "OPENSETTING_NAME";
constexpr const char* kCableDelay = "OPENSETTING_CABLEDELAY";
constexpr const char* kModified = "OPENSETTING_MODIFIED";
constexpr const char* kStamp = "OPENSETTING_STAMP";

// What changes without changing the setting: the instrument's states and outputs, the system
// profile, the segments (kept apart from settings) and unit attributes (how a value is shown).
constexpr const char* kNotOfTheSetting[] = {":SGEN:GLOB:INIT:CONT", ":SGEN:GLOB:SYST:STAT", ":SGEN:GLOB:PLL:STAT",
                                            ":SGEN:GLOB:CONN", ":CONF:PROF"};
constexpr const char* kSegmentPrefix = ":EDIT:SEGM";
constexpr const char* kAttrSuffix = ":ATTR";
constexpr const char* kSystemProfile = ":CONF:PROF";

bool IsOfTheSetting(const Dstring& header) {
  for (const char* name : kNotOfTheSetting) {
    if (header == name) return false;
  }
  return !header.StartsWith(kSegmentPrefix) && !header.EndsWith(kAttrSuffix);
}

// A change set reply: "ALL", or quoted names, each with the handle that asked first.
struct Changes {
  bool all = false;
  bool profile = false;
  bool setting = false;
};

Changes Classify(const Dstring& reply, const Dstring& handle) {
  Changes seen;
  const Dstring prefix = ":" + handle.ToUpper();
  std::size_t pos = 0;
  while ((pos = reply.find('"', pos)) != Dstring::npos) {
    const std::size_t end = reply.find('"', pos + 1);
    if (end == Dstring::npos) break;
    Dstring name = Dstring(reply.substr(pos + 1, end - pos - 1)).ToUpper();
    pos = end + 1;
    if (name == "ALL") {
      seen.all = true;
      continue;
    }
    if (name.StartsWith(prefix)) name = Dstring(name.substr(prefix.size()));
    seen.profile = seen.profile || name == kSystemProfile;
    seen.setting = seen.setting || IsOfTheSetting(name);
  }
  return seen;
}

bool IsHandleWord(const Dstring& text) {
  if (text.empty()) return false;
  for (char c : text) {
    if (!std::isalnum(static_cast<unsigned char>(c)) && c != '_') return false;
  }
  return true;
}

Dstring RandomStamp() {
  static std::mt19937_64 engine{std::random_device{}()};
  return Dstring::Format("%016llx", static_cast<unsigned long long>(engine()));
}

// The operation that did not happen, then why.
int Refused(const char* key, const Dstring& name, int status, const ConditionList& reason, ConditionList& list) {
  ConditionListLoader::ConditionToken(list, key, {name}, status);
  if (status == QenStatus::kLocked) ConditionListLoader::ConditionToken(list, "GUI_SETTING_LOCKED", {}, status);
  list.Append(reason);
  return status;
}

}  // namespace

OpenSettingDs::OpenSettingDs() : mStampSource(&RandomStamp) {}

Dstring OpenSettingDs::Title() const {
  const Dstring name = mName.empty() ? Dstring(StartUpConfig::kDefaultSettingName) : mName;
  return mModified ? Dstring(name + " *") : name;
}

int OpenSettingDs::Read(ConditionList& list) {
  Record record;
  if (int status = ReadRecord(record, list)) return status;
  Adopt(record);
  return 0;
}

int OpenSettingDs::ReadRecord(Record& record, ConditionList& list) {
  DstringList names;
  if (int status = QENSystemProfile::Names(names, list)) return status;
  unsigned long modified = 0;
  int status = 0;
  if (names.Contains(kName)) status = QENSystemProfile::GetValue(kName, record.name, list);
  if (status == 0 && names.Contains(kModified)) status = QENSystemProfile::GetValue(kModified, modified, list);
  if (status == 0 && names.Contains(kStamp)) status = QENSystemProfile::GetValue(kStamp, record.stamp, list);
  record.modified = modified != 0;
  return status;
}

int OpenSettingDs::WriteRecord(const Record& record, ConditionList& list) {
  if (int status = QENSystemProfile::SetValue(kName, record.name, list)) return status;
  if (record.cableDelay) {
    if (int status = QENSystemProfile::SetValue(kCableDelay, *record.cableDelay ? 1UL : 0UL, list)) return status;
  }
  // The stamp before the mark: a client that reads the new stamp knows the setting was replaced.
  if (int status = QENSystemProfile::SetValue(kStamp, record.stamp, list)) return status;
  return QENSystemProfile::SetValue(kModified, record.modified ? 1UL : 0UL, list);
}

void OpenSettingDs::Adopt(const Record& record) {
  const bool changed = record.name != mName || record.modified != mModified;
  mName = record.name;
  mModified = record.modified;
  mRecordModified = record.modified;
  mStamp = record.stamp;
  mRecordRead = true;
  if (!changed) return;
  ConditionList ignored;
  QenDs::Update(ignored, 0);
}

int OpenSettingDs::Follow(const Dstring& resource, ConditionList& list) {
  Dstring handle = QenGuiInst::GetAppHandle() + "W";
  if (int status = AppHandle::Create(QenGuiInst::GetInstrument(), handle, resource, list)) return status;
  if (!IsHandleWord(handle)) {
    ConditionListLoader::ConditionToken(list, "GUI_STATE_BAD_REPLY", {Dstring(":QEN:INST:HAND:CRE?"), handle},
                                        QenStatus::kProtocolError);
    return QenStatus::kProtocolError;
  }
  mWatch = handle;
  return 0;
}

int OpenSettingDs::EndFollow(ConditionList& list) {
  if (mWatch.empty()) return 0;
  const int status = AppHandle::Destroy(QenGuiInst::GetInstrument(), mWatch, list);
  mWatch.clear();
  return status;
}

int OpenSettingDs::UpdateFromFW(ConditionList& list) {
  if (mWatch.empty()) return 0;
  LgsDebug trace("OpenSettingDs::UpdateFromFW", "settings");
  FWBlocker guard("OpenSettingDs::UpdateFromFW", list);
  if (int status = guard.Block()) return status;
  if (mUnwritten) {
    if (int status = WriteRecord(*mUnwritten, list)) return status;
    mUnwritten.reset();
  } else if (!mRecordRead) {
    if (int status = Read(list)) return status;
  }
  Dstring reply;
  if (int status = QenGuiInst::Call(Dstring::Format("%s:DFL?", mWatch.c_str()), reply, list)) return status;
  const Changes seen = Classify(reply.Trimmed(), mWatch);
  bool modified = seen.setting;
  if (seen.all || seen.profile) {
    Record record;
    if (int status = ReadRecord(record, list)) {
      mRecordRead = false;
      return status;
    }
    // Only a new or loaded setting moves the stamp; any other "ALL" is a change of everything.
    modified = modified || (seen.all && record.stamp == mStamp);
    Adopt(record);
  }
  if (modified || (mModified && !mRecordModified)) return MarkModified(list);
  return 0;
}

int OpenSettingDs::MarkModified(ConditionList& list) {
  if (!mModified) {
    mModified = true;
    ConditionList ignored;
    QenDs::Update(ignored, 0);
  }
  if (mRecordModified) return 0;
  if (int status = QENSystemProfile::SetValue(kModified, 1UL, list)) return status;
  mRecordModified = true;
  return 0;
}

void OpenSettingDs::DropChanges() {
  if (mWatch.empty()) return;
  Dstring ignoredReply;
  ConditionList ignored;
  QenGuiInst::Call(Dstring::Format("%s:DFL?", mWatch.c_str()), ignoredReply, ignored);
}

int OpenSettingDs::Opened(Record record, SettingMRU* mru, ConditionList& list) {
  record.stamp = mStampSource();
  ConditionList reason;
  const int status = WriteRecord(record, reason);
  DropChanges();
  Adopt(record);
  if (status != 0) {
    // The instrument holds it all the same: the record is written again at the next poll.
    mUnwritten = record;
    Refused("GUI_SETTING_NOT_RECORDED", Title(), status, reason, list);
  }
  if (mru != nullptr && !record.name.empty()) {
    if (int rc = mru->Record(record.name, list); status == 0) return rc;
  }
  return status;
}

int OpenSettingDs::New(ConditionList& list) {
  ConditionList reason;
  FWBlocker guard("OpenSettingDs::New", reason);
  int status = guard.Block();
  if (status == 0) status = SettingFile::New(reason);
  if (status != 0) return Refused("GUI_SETTING_NEW_FAILED", Dstring(), status, reason, list);
  return Opened(Record{}, nullptr, list);
}

int OpenSettingDs::Load(const Dstring& name, bool cableDelay, SettingMRU& mru, ConditionList& list) {
  ConditionList reason;
  FWBlocker guard("OpenSettingDs::Load", reason);
  int status = guard.Block();
  if (status == 0) status = SettingFile::Load(name, cableDelay, reason);
  if (status != 0) return Refused("GUI_SETTING_LOAD_FAILED", name, status, reason, list);
  Record record;
  record.name = name;
  record.cableDelay = cableDelay;
  return Opened(record, &mru, list);
}

int OpenSettingDs::Save(const Dstring& name, SettingMRU& mru, ConditionList& list, const ReplaceQuestion& replace) {
  ConditionList reason;
  FWBlocker guard("OpenSettingDs::Save", reason);
  int status = guard.Block();
  if (status == 0 && replace) {
    DstringList names;
    status = SettingFile::Catalogue(names, reason);
    if (status == 0 && names.Contains(name) && !replace(name)) return SettingsStatus::kDeclined;
  }
  if (status == 0) status = SettingFile::Save(name, reason);
  if (status != 0) return Refused("GUI_SETTING_SAVE_FAILED", name, status, reason, list);
  Record record;
  record.name = name;
  return Opened(record, &mru, list);
}
