#include "instrument/QenInstrument.h"

#include <cstdlib>
#include <utility>

#include "instrument/QenStatus.h"

namespace {

struct StatusText {
  int status;
  const char* text;
};

constexpr StatusText kStatusTexts[] = {
    {QenStatus::kOk, "No error"},
    {QenStatus::kNotConnected, "Not connected to the instrument server"},
    {QenStatus::kConnectFailed, "The instrument server could not be reached"},
    {QenStatus::kTimeOut, "The instrument server did not answer in time"},
    {QenStatus::kFrameTooLarge, "Message larger than 16 MiB refused"},
    {QenStatus::kProtocolError, "The instrument server sent a malformed message"},
    {QenStatus::kBadCommand, "The command cannot be sent"},
    {QenStatus::kCommError, "Communication with the instrument server failed"},
    {QenStatus::kCallBusy, "Another command is still waiting for the instrument server"},
    {QenStatus::kAbandoned, "The wait for the instrument server was given up; the connection is closed"},
    {QenStatus::kServerTerminated, "Server terminated"},
    {QenStatus::kLocked, "The instrument is locked by another client"},
};

constexpr int kFallbackReplyTimeoutMs = 30000;

int ReplyTimeoutFromEnvironment() {
  const char* text = std::getenv("QEN_REPLY_TIMEOUT");
  if (text == nullptr || *text == '\0') return kFallbackReplyTimeoutMs;
  char* end = nullptr;
  const double seconds = std::strtod(text, &end);
  if (*end != '\0' || !(seconds > 0.0) || seconds > 86400.0) return kFallbackReplyTimeoutMs;
  return static_cast<int>(seconds * 1000.0);
}

int gDefaultReplyTimeoutMs = -1;
Dstring gTimedOutCommand;
int gTimedOutMs = 0;

}  // namespace

int QenInstrument::GetDefaultReplyTimeoutMs() {
  if (gDefaultReplyTimeoutMs < 0) gDefaultReplyTimeoutMs = ReplyTimeoutFromEnvironment();
  return gDefaultReplyTimeoutMs;
}

void QenInstrument::SetDefaultReplyTimeoutMs(int ms) { gDefaultReplyTimeoutMs = ms; }

void QenInstrument::NoteTimeOut(const Dstring& cmd, int timeoutMs) {
  gTimedOutCommand = cmd;
  gTimedOutMs = timeoutMs;
}

Dstring QenInstrument::GetErrMessage(int status) {
  // The note belongs to the one time-out it was made for.
  if (status == QenStatus::kTimeOut && !gTimedOutCommand.empty()) {
    // The command travels inside the quotes of the entry: its own quotes and the bytes of a
    // data block would break it.
    Dstring command = std::exchange(gTimedOutCommand, Dstring());
    if (command.size() > 80) command = Dstring(command.substr(0, 80)) + "...";
    for (char& c : command) {
      if (c == '"') c = '\'';
      if (static_cast<unsigned char>(c) < 0x20 || static_cast<unsigned char>(c) >= 0x7f) c = ' ';
    }
    return Dstring::Format("%d,\"The instrument server did not answer %s within %g s\"", status, command.c_str(),
                           gTimedOutMs / 1000.0);
  }
  for (const auto& entry : kStatusTexts) {
    if (entry.status == status) return Dstring::Format("%d,\"%s\"", status, entry.text);
  }
  return Dstring::Format("%d,\"Unknown instrument client error\"", status);
}
