#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "SimDirtySet.h"
#include "SimErrorQueue.h"
#include "support/Dstring.h"

// An application handle: its error queue, what it has not heard yet, and the last batch it
// ran with the parameters whose values and limits that batch changed.
class SimHandle {
 public:
  explicit SimHandle(int owner) : mOwner(owner) {}

  int GetOwner() const { return mOwner; }
  SimErrorQueue& Errors() { return mErrors; }
  SimDirtySet& Dirty() { return mDirty; }

  // The text goes into the room the last one had: a batch of data blocks takes no new memory.
  void SetLastBatch(std::string_view text, std::vector<std::size_t> values, std::vector<std::size_t> limits) {
    mLastBatch.assign(text);
    mLastValues = std::move(values);
    mLastLimits = std::move(limits);
  }
  // The same with the text itself; `text` gets the room of the batch kept before.
  void TakeLastBatch(std::string& text, std::vector<std::size_t> values, std::vector<std::size_t> limits) {
    text.swap(mLastBatch);
    mLastValues = std::move(values);
    mLastLimits = std::move(limits);
  }
  const Dstring& GetLastBatch() const { return mLastBatch; }
  const std::vector<std::size_t>& GetLastValues() const { return mLastValues; }
  const std::vector<std::size_t>& GetLastLimits() const { return mLastLimits; }

 private:
  int mOwner;
  SimErrorQueue mErrors;
  SimDirtySet mDirty;
  Dstring mLastBatch;
  std::vector<std::size_t> mLastValues;
  std::vector<std::size_t> mLastLimits;
};
