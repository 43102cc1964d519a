#pragma once

#include <utility>
#include <vector>

// Pins data sources for the length of a pass over them (QenDs::Pin): a view that frees one
// while it is told can neither pull it away during the pass nor change what freeing decides.
template <typename Source>
class PinnedSources {
 public:
  explicit PinnedSources(std::vector<Source*> sources) : mSources(std::move(sources)) {
    for (auto* s : mSources) s->Pin();
  }
  ~PinnedSources() {
    for (auto* s : mSources) s->Unpin();
  }
  PinnedSources(const PinnedSources&) = delete;
  PinnedSources& operator=(const PinnedSources&) = delete;

  const std::vector<Source*>& Get() const { return mSources; }

 private:
  std::vector<Source*> mSources;
};
