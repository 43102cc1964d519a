#pragma once

#include <memory>

#include "support/Dstring.h"
#include "support/LispList.h"

class MDIChild;
struct NDRect16;

// Identifies one instance of a tool window: which port, segment, parameter page, sequence or
// block the window shows. Two requests name the same window instance when
// their records are equal (isEqual); a record can be written to a LispList and rebuilt from
// one (NDTools::InstanceInfoFactory). The root of the record classes, in place of the
// legacy RWCollectable: IsA, isEqual, Clone and asLispList are its polymorphic operations.
//
// The window and the resource box are not owned and not copied deeply. Default values: an
// empty name, no window, no box, 0 for numbers, empty texts.
class InstanceInfo {
 public:
  InstanceInfo() = default;
  InstanceInfo(const InstanceInfo&) = default;
  InstanceInfo& operator=(const InstanceInfo&) = default;
  // Element 1: the instance name.
  explicit InstanceInfo(const LispList& list);
  virtual ~InstanceInfo() = default;

  // The class name, exactly as the class is spelt.
  virtual const char* IsA() const { return "InstanceInfo"; }
  // Equal only to a record of the same class (IsA) with the same instance name.
  virtual bool isEqual(const InstanceInfo* other) const;
  virtual std::unique_ptr<InstanceInfo> Clone() const { return std::make_unique<InstanceInfo>(*this); }
  // Empties the list, then: 0 the IsA text, 1 the instance name, then each class's fields.
  virtual void asLispList(LispList& list) const;

  const Dstring& GetInstanceName() const { return mInstanceName; }
  void SetInstanceName(const Dstring& name) { mInstanceName = name; }
  MDIChild* GetWin() const { return mWin; }
  void SetWin(MDIChild* win) { mWin = win; }
  const NDRect16* GetResBox() const { return mResBox; }
  void SetResBox(const NDRect16* box) { mResBox = box; }

 protected:
  bool SameClass(const InstanceInfo* other) const;
  // Element `index` of the list as text or as a number; `out` is left alone when the element
  // is missing or of another kind.
  static void ReadText(const LispList& list, std::size_t index, Dstring& out);
  static void ReadNumber(const LispList& list, std::size_t index, unsigned long& out);
  static void AppendText(LispList& list, const Dstring& text);
  static void AppendNumber(LispList& list, unsigned long n);

 private:
  Dstring mInstanceName;
  MDIChild* mWin = nullptr;
  const NDRect16* mResBox = nullptr;
};
