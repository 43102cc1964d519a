#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

// Cuts the records of ONC RPC over TCP out of a byte stream that arrives in arbitrary pieces.
// A record is one or more fragments, each behind a 4-byte mark: the last-fragment bit and a
// 31-bit length. A record longer than kMaxRecord ends the stream: nothing after it can be
// trusted to be in step.
class SimRpcRecordReader {
 public:
  // Room for the largest write a client may send (the device's maximum) and its call header,
  // many times over.
  static constexpr std::size_t kMaxRecord = 1024u * 1024u;

  enum class Result { None, Record, TooLarge };

  void Feed(const char* data, std::size_t size) { mBuffer.append(data, size); }
  // The next complete record, or None when more bytes are needed.
  Result Next(std::string& record);
  // `record` as one last fragment.
  static std::string Mark(const std::string& record);

 private:
  std::string mBuffer;
  std::string mRecord;  // the fragments of the current record taken so far
  bool mTooLarge = false;
};
