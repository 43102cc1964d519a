#include "settings/SettingTransfer.h"

#include <cerrno>
#include <cstring>
#include <fstream>

#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "settings/QENSystemProfile.h"
#include "support/ConditionListLoader.h"
#include "support/DataParcel.h"
#include "support/ExportFile.h"
#include "support/FWBlocker.h"
#include "support/ParserExpression.h"

namespace {

using Kind = SettingText::Kind;

const char* Noun(Kind kind) { return kind == Kind::kSetting ? "setting" : "sequence"; }

// The command, after the handle, that sends (query) or takes (write) the text.
Dstring DataCommand(Kind kind) {
  return Dstring::Format(":%s%s", QenGuiInst::GetAppHandle().c_str(),
                         kind == Kind::kSetting ? ":MMEM:SETT:DATA" : ":SGEN:GLOB:SEQ:DATA");
}

Dstring Number(std::size_t n) { return Dstring::Format("%zu", n); }

int Refuse(ConditionList& list, std::string_view key, std::initializer_list<Dstring> args, int status = 1) {
  ConditionListLoader::ConditionToken(list, key, args, status);
  return status;
}

// -19 brings no condition from the call path (a lock is a state); here it is why nothing happened.
int SayLocked(int status, ConditionList& list) {
  if (status == QenStatus::kLocked) Refuse(list, "GUI_SETTING_TRANSFER_LOCKED", {}, status);
  return status;
}

// A text block (the reply of a DATA query): "#<n><length><text>".
Dstring AsBlock(const Dstring& text) {
  const Dstring digits = Number(text.size());
  return Dstring::Format("#%zu", digits.size()) + digits + text;
}

int ReadReply(Kind kind, SettingText& out, ConditionList& list) {
  FWBlocker guard("SettingTransfer::Export", list);
  if (int status = guard.Block()) return SayLocked(status, list);
  Dstring reply;
  if (int status = QenGuiInst::Call(DataCommand(kind) + "?", reply, list)) return SayLocked(status, list);
  DataParcel items;
  ConditionList ignored;
  if (ParserExpression::Parse(reply, items, ignored) != 0 || items.size() != 1 ||
      items[0].GetType() != DataItemType::Block) {
    Dstring shown = reply.substr(0, 60);
    return Refuse(list, "GUI_SETTING_TEXT_NOT_BLOCK", {shown + (reply.size() > 60 ? "..." : ""), Noun(kind)});
  }
  // A reply is never trusted: what goes into the user's file is what this program reads back.
  SettingText::Problem problem;
  if (!SettingText::Read(items[0].GetText(), kind, out, problem)) {
    return Refuse(list, "GUI_SETTING_TEXT_REPLY", {Noun(kind), Number(static_cast<std::size_t>(problem.line)), problem.what});
  }
  return 0;
}

}  // namespace

int SettingTransfer::Export(Kind kind, const Dstring& path, ConditionList& list) {
  SettingText text(kind);
  int status = ReadReply(kind, text, list);
  if (status == 0) status = ExportFile::WriteText(path, text.Write(), list);
  if (status != 0) Refuse(list, "GUI_SETTING_NOT_EXPORTED", {Noun(kind), path}, status);
  return status;
}

int SettingTransfer::ReadFile(Kind kind, const Dstring& path, SettingText& out, ConditionList& list) {
  errno = 0;
  std::ifstream file(path, std::ios::binary);
  if (!file) return Refuse(list, "GUI_IMPORT_READ", {path, Dstring(std::strerror(errno != 0 ? errno : ENOENT))});
  Dstring text;
  char buffer[65536];
  while (file.read(buffer, sizeof buffer) || file.gcount() > 0) {
    text.append(buffer, static_cast<std::size_t>(file.gcount()));
    // Whatever the file, this program never holds more of it than it could send.
    if (text.size() > kMaxFileBytes) {
      return Refuse(list, "GUI_SETTING_TEXT_TOO_BIG", {path, Noun(kind), Number(kMaxFileBytes)});
    }
  }
  if (file.bad()) return Refuse(list, "GUI_IMPORT_READ", {path, Dstring(std::strerror(errno != 0 ? errno : EIO))});
  SettingText::Problem problem;
  if (!SettingText::Read(text, kind, out, problem)) {
    return Refuse(list, "GUI_SETTING_TEXT_LINE", {path, Number(static_cast<std::size_t>(problem.line)), problem.what});
  }
  return 0;
}

int SettingTransfer::Send(const SettingText& text, bool cableDelay, ConditionList& list) {
  FWBlocker guard("SettingTransfer::Import", list);
  if (int status = guard.Block()) return SayLocked(status, list);
  const Dstring choice = text.GetKind() == Kind::kSetting ? (cableDelay ? "ON," : "OFF,") : "";
  Dstring reply;
  const int status = QenGuiInst::Call(DataCommand(text.GetKind()) + " " + choice + AsBlock(text.Write()), reply, list);
  return SayLocked(status, list);
}

int SettingTransfer::ImportSetting(const Dstring& path, bool cableDelay, ConditionList& list) {
  SettingText text;
  int status = ReadFile(Kind::kSetting, path, text, list);
  if (status == 0) status = Send(text, cableDelay, list);
  if (status != 0) {
    SayNotImported(Kind::kSetting, path, status, list);
    return status;
  }
  return QENSystemProfile::SetValue("OPENSETTING_NAME", Dstring(), list);
}

void SettingTransfer::SayNotImported(Kind kind, const Dstring& path, int status, ConditionList& list) {
  Refuse(list, "GUI_SETTING_NOT_IMPORTED", {Noun(kind), path}, status);
}
