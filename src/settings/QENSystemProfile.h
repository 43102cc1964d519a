#pragma once

#include "settings/TypedProfile.h"
#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/Dstring.h"
#include "support/DstringList.h"
#include "support/LispList.h"

// Named values that belong to the instrument system, kept on the server one by one: every
// operation is one command. Values travel in the forms of ProfileValue ("(12i)"); a text
// travels as a quoted string, so that commas and parentheses in it survive.
class QENSystemProfile : public TypedProfile<QENSystemProfile> {
 public:
  static int Exists(const Dstring& name, int& exists, ConditionList& list);
  // The names of every value, as the server lists them: one command.
  static int Names(DstringList& names, ConditionList& list);

 private:
  friend class TypedProfile<QENSystemProfile>;
  static constexpr bool kParens = true;
  static int Query(const Dstring& name, Dstring& reply, ConditionList& list);
  template <typename T>
  static int GetTyped(const Dstring& name, T& value, ConditionList& list);
  static int Put(const Dstring& name, const Dstring& valueText, ConditionList& list);
  static Dstring TextValue(const Dstring& text);
};

extern template class TypedProfile<QENSystemProfile>;
