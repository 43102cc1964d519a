#pragma once

#include <cstdint>
#include <string_view>

#include "SimCommandProcessor.h"
#include "SimErrorQueue.h"

// One raw SCPI connection: the command language without the application handle, and the
// IEEE 488.2 common commands with the status byte and the standard event status register.
// The connection gets its own handle (and with it its own change set); every error of its
// commands moves to its SCPI error queue, which sets the event bits that the error's class
// names. While another client holds the lock, queries still run and writes are refused with
// -203 "Command protected".
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

  SimScpiSession(SimCommandProcessor& processor, int connection);

  // Runs one program message; true when it produced a response (`reply`, without terminator).
  bool Execute(std::string_view message, Dstring& reply);
  // A message that did not fit the input buffer: -363 "Input buffer overrun".
  void Overrun() { Queue(-363, "Input buffer overrun"); }
  // A response that was dropped before it was read: -410 "Query INTERRUPTED".
  void Interrupted() { Queue(-410, "Query INTERRUPTED"); }

  const Dstring& GetHandle() const { return mHandle; }
  std::uint8_t StatusByte() const;

 private:
  using Common = void (SimScpiSession::*)(std::string_view args, DstringList& replies);
  struct CommonEntry {
    const char* header;
    Common run;
  };
  static const CommonEntry kCommon[];

  void RunUnit(std::string_view unit, DstringList& replies);
  void RunCommon(std::string_view header, std::string_view args, DstringList& replies);
  void RunInstrument(std::string_view unit, DstringList& replies);
  bool EnsureHandle();
  void Queue(int code, const Dstring& text);
  // Moves the `count` errors the last command queued on the handle to the SCPI queue.
  void TakeHandleErrors(int count);
  // Reads a register value 0..255 from `args`; queues the error and returns false otherwise.
  bool ReadRegister(std::string_view args, std::uint8_t& value);

  void Idn(std::string_view args, DstringList& replies);
  void Rst(std::string_view args, DstringList& replies);
  void Cls(std::string_view args, DstringList& replies);
  void EsrQuery(std::string_view args, DstringList& replies);
  void Ese(std::string_view args, DstringList& replies);
  void EseQuery(std::string_view args, DstringList& replies);
  void Opc(std::string_view args, DstringList& replies);
  void OpcQuery(std::string_view args, DstringList& replies);
  void StbQuery(std::string_view args, DstringList& replies);
  void Sre(std::string_view args, DstringList& replies);
  void SreQuery(std::string_view args, DstringList& replies);
  void Wai(std::string_view args, DstringList& replies);
  void TstQuery(std::string_view args, DstringList& replies);
  void ErrQuery(std::string_view args, DstringList& replies);

  SimCommandProcessor& mProcessor;
  int mConnection;
  Dstring mHandle;
  SimErrorQueue mErrors;
  std::uint8_t mEsr = kPon;
  std::uint8_t mEse = 0;
  std::uint8_t mSre = 0;
};
