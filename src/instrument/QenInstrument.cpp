#include "instrument/QenInstrument.h"

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
    {QenStatus::kServerTerminated, "Server terminated"},
    {QenStatus::kLocked, "The instrument is locked by another client"},
};

}  // namespace

Dstring QenInstrument::GetErrMessage(int status) {
  for (const auto& entry : kStatusTexts) {
    if (entry.status == status) return Dstring::Format("%d,\"%s\"", status, entry.text);
  }
  return Dstring::Format("%d,\"Unknown instrument client error\"", status);
}
