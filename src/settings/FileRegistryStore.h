#pragma once

#include <functional>

#include "settings/RegistryStore.h"
#include "settings/RegistryTree.h"

// The registry as a file that mirrors the key tree (RegistryTree's text form). Every change
// reads the file, changes the tree and replaces the file whole: the new text goes to a
// temporary file beside it, is flushed to the disk and renamed over the old one, so that a
// crash or a kill at any moment leaves either the old or the new file, never a mix. Changes
// from several programs are taken one at a time under a lock on "<file>.lock". A file that
// cannot be read whole is refused and left alone.
class FileRegistryStore : public RegistryStore {
 public:
  explicit FileRegistryStore(Dstring path) : mPath(std::move(path)) {}

  // $XDG_CONFIG_HOME/qengui/registry, else ~/.config/qengui/registry.
  static Dstring DefaultPath();

  int Query(void* root, const Dstring& key, const Dstring& name, Dstring& data, ConditionList& list) override;
  int Set(void* root, const Dstring& key, const Dstring& name, const Dstring& data, ConditionList& list) override;
  int HasValue(void* root, const Dstring& key, const Dstring& name, bool& exists, ConditionList& list) override;
  int HasKey(void* root, const Dstring& key, bool& exists, ConditionList& list) override;
  int DeleteValue(void* root, const Dstring& key, const Dstring& name, ConditionList& list) override;
  int DeleteKey(void* root, const Dstring& key, ConditionList& list) override;

 private:
  using Look = std::function<const char*(const RegistryTree&)>;
  using Change = std::function<const char*(RegistryTree&)>;

  int Inspect(const Dstring& key, const Dstring& name, const Look& look, ConditionList& list) const;
  int Modify(const Dstring& key, const Dstring& name, const Change& change, ConditionList& list);
  // A missing file is an empty tree; otherwise the reason it cannot be read.
  Dstring Load(RegistryTree& tree) const;
  Dstring Save(const RegistryTree& tree) const;

  Dstring mPath;
};
