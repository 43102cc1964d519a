#pragma once

#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/DstringList.h"
#include "support/Dstring.h"
#include "support/LispList.h"

// Named values that belong to the instrument system, kept on the server one by one: every
// operation is one command. Values travel in the forms of ProfileValue ("(12i)"); a text
// travels as a quoted string, so that commas and parentheses in it survive.
class QENSystemProfile {
 public:
  static int Exists(const Dstring& name, int& exists, ConditionList& list);
  // The names of every value, as the server lists them: one command.
  static int Names(DstringList& names, ConditionList& list);
  static int GetValue(const Dstring& name, long& value, ConditionList& list);
  static int GetValue(const Dstring& name, unsigned long& value, ConditionList& list);
  static int GetValue(const Dstring& name, float& value, ConditionList& list);
  static int GetValue(const Dstring& name, double& value, ConditionList& list);
  static int GetValue(const Dstring& name, Dstring& value, ConditionList& list);
  static int GetValue(const Dstring& name, DataParcel& value, ConditionList& list);
  static int GetValue(const Dstring& name, LispList& value, ConditionList& list);
  static int SetValue(const Dstring& name, long value, ConditionList& list);
  static int SetValue(const Dstring& name, unsigned long value, ConditionList& list);
  static int SetValue(const Dstring& name, float value, ConditionList& list);
  static int SetValue(const Dstring& name, double value, ConditionList& list);
  static int SetValue(const Dstring& name, const Dstring& value, ConditionList& list);
  static int SetValue(const Dstring& name, const DataParcel& value, ConditionList& list);
  static int SetValue(const Dstring& name, const LispList& value, ConditionList& list);

 private:
  static int Query(const Dstring& name, Dstring& reply, ConditionList& list);
  template <typename T>
  static int GetTyped(const Dstring& name, T& value, ConditionList& list);
  static int Put(const Dstring& name, const Dstring& valueText, ConditionList& list);
};
