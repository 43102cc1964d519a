#pragma once

#include <functional>
#include <vector>

#include "data/QenDsView.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class SegmentCatalogDs;

// Keeps a list of segments in step with the instrument's catalogue (the pool's
// SegmentCatalogDs): `refresh` runs whenever the names change. Follows from construction to
// destruction, and holds the catalogue alive meanwhile.
class SegmentCatalogFollower : public QenDsView {
 public:
  explicit SegmentCatalogFollower(std::function<void()> refresh);
  ~SegmentCatalogFollower() override;
  SegmentCatalogFollower(const SegmentCatalogFollower&) = delete;
  SegmentCatalogFollower& operator=(const SegmentCatalogFollower&) = delete;

  // Reads the catalogue; the refresh runs when the names changed.
  int Read(ConditionList& list);
  const std::vector<Dstring>& GetNames() const;
  // Whether the names were read: before, no name counts as missing.
  bool IsRead() const;
  // Whether the catalogue was read and lacks `name`, which is not open here either.
  bool IsMissing(const Dstring& name) const;

  int NfyViewDataUpdated(QenDs* source, ConditionList& list) override;

 private:
  SegmentCatalogDs* mCatalog;
  std::function<void()> mRefresh;
};
