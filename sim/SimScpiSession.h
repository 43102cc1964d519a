#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "SimCommandProcessor.h"
#include "SimErrorQueue.h"
#include "SimScpiStatus.h"

// One raw SCPI connection: the command language without the application handle, and the
// IEEE 488.2 common commands with the status byte, the standard event status register and the
// SCPI status registers. The connection gets its own handle (and with it its own change set);
// every error of its commands moves to its SCPI error queue, which sets the event bits that
// the error's class names. While another client holds the lock, queries still run and writes
// are refused with -203 "Command protected".
// *WAI and *OPC? wait for the instrument's operations: the session then parks its message
// (IsWaiting) and the owner calls Tick until it answers; nothing blocks.
class SimScpiSession {
 public:
  // Standard event status register bits.
  static constexpr std::uint8_t kOpc = 0x01;
  static constexpr std::uint8_t kQye = 0x04;
  static constexpr std::uint8_t kDde = 0x08;
  static constexpr std::uint8_t kExe = 0x10;
  static constexpr std::uint8_t kCme = 0x20;
  static constexpr std::uint8_t kPon = 0x80;
  // Status byte bits.
  static constexpr std::uint8_t kEav = 0x04;
  static constexpr std::uint8_t kEsb = 0x20;
  static constexpr std::uint8_t kMss = 0x40;
  // The settings *SAV and *RCL keep the numbered states in.
  static constexpr int kMaxSaved = 9;

  enum class Outcome { Silent, Answered, Waiting };

  SimScpiSession(SimCommandProcessor& processor, int connection);

  // Runs one program message. Answered: it asked anything, and `reply` is its response
  // (without terminator), empty when its queries all failed. Waiting: it is parked at a *WAI
  // or *OPC?; no message may follow until Tick has finished it.
  Outcome Execute(std::string message, Dstring& reply);
  // Looks at the instrument again: a pending *OPC sets its bit, a parked message goes on.
  Outcome Tick(Dstring& reply);
  bool IsWaiting() const { return mNext < mUnits.size(); }
  // The storage of the message it has run, to receive the next one into; empty while waiting.
  std::string ReleaseMessage() { return IsWaiting() ? std::string() : std::move(mMessage); }
  // Tick has something to look for.
  bool NeedsTicks() const { return IsWaiting() || mOpcArmed; }
  // A message that did not fit the input buffer: -363 "Input buffer overrun".
  void Overrun() { Queue(-363, "Input buffer overrun"); }
  // A response that was dropped before it was read: -410 "Query INTERRUPTED".
  void Interrupted() { Queue(-410, "Query INTERRUPTED"); }
  // A message whose block was shorter than its header said: -161 "Invalid block data".
  void ShortBlock() { Queue(-161, "Invalid block data"); }
  // A device clear: a parked message and a pending *OPC are dropped.
  void DeviceClear();
  // The lines that clear the device over a socket: "DCL" and "SDC".
  static bool IsDeviceClear(std::string_view message);

  const Dstring& GetHandle() const { return mHandle; }
  std::uint8_t StatusByte() const;

 private:
  using Common = void (SimScpiSession::*)(std::string_view args, DstringList& replies);
  struct CommonEntry {
    const char* header;
    Common run;
    bool takesValue;
  };
  static const CommonEntry kCommon[];

  Outcome Continue(Dstring& reply);
  void RunUnit(std::string_view unit, DstringList& replies);
  void RunCommon(std::string_view header, std::string_view args, DstringList& replies);
  void RunInstrument(const Dstring& header, std::string_view args, DstringList& replies);
  void RunError(const Dstring& header, std::string_view args, DstringList& replies);
  Dstring Addressed(const Dstring& header) const;
  bool EnsureHandle();
  // The reply of a query of this connection's handle; empty when it failed.
  Dstring Ask(const char* header);
  // Reads the instrument's states into the status registers; the operation condition.
  std::uint16_t Sample();
  void Queue(int code, const Dstring& text);
  static constexpr int kAll = static_cast<int>(SimErrorQueue::kCapacity);
  // Moves the errors a command queued in the language to the SCPI queue.
  void TakeErrors(const Dstring& owner, int count);
  // Reads a value 0..max from `args`; queues the error and returns false otherwise.
  bool ReadValue(std::string_view args, int max, int& value);

  void Idn(std::string_view args, DstringList& replies);
  void Rst(std::string_view args, DstringList& replies);
  void Cls(std::string_view args, DstringList& replies);
  void EsrQuery(std::string_view args, DstringList& replies);
  void Ese(std::string_view args, DstringList& replies);
  void EseQuery(std::string_view args, DstringList& replies);
  void Opc(std::string_view args, DstringList& replies);
  void OpcQuery(std::string_view args, DstringList& replies);
  void OptQuery(std::string_view args, DstringList& replies);
  void StbQuery(std::string_view args, DstringList& replies);
  void Sre(std::string_view args, DstringList& replies);
  void SreQuery(std::string_view args, DstringList& replies);
  void Wai(std::string_view args, DstringList& replies);
  void TstQuery(std::string_view args, DstringList& replies);
  void Sav(std::string_view args, DstringList& replies);
  void Rcl(std::string_view args, DstringList& replies);

  SimCommandProcessor& mProcessor;
  int mConnection;
  Dstring mHandle;
  SimErrorQueue mErrors;
  SimScpiStatus mStatus;
  std::uint8_t mEsr = 0;
  std::uint8_t mEse = 0;
  std::uint8_t mSre = 0;
  bool mOpcArmed = false;  // *OPC waits for the operations to end

  // The message being run: its units, the next to run, and what it has answered so far.
  std::string mMessage;
  Dstring mText;  // the instrument command being run
  std::vector<std::string_view> mUnits;
  std::size_t mNext = 0;
  DstringList mReplies;
  bool mAsked = false;
  bool mCommandError = false;
};
