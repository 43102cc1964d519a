#pragma once

#include <type_traits>

#include "settings/ProfileValue.h"
#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/Dstring.h"
#include "support/LispList.h"

// The typed GetValue and SetValue family that every profile offers, written once. A profile
// derives from it and tells it, as a friend, how it reads a value of each type (GetTyped), how
// it keeps a value text (Put), how a text value is written (TextValue) and whether numbers are
// written in parentheses (kParens). `Where` are the arguments that locate the store ahead of
// the value name: none for the server profiles, a root and a key path for the registry.
//
// The members are not inline: a profile's header declares the instantiation extern and its
// source, where GetTyped is defined, makes it.
template <typename Profile, typename... Where>
class TypedProfile {
 public:
  static int GetValue(Where... where, const Dstring& name, long& value, ConditionList& list);
  static int GetValue(Where... where, const Dstring& name, unsigned long& value, ConditionList& list);
  static int GetValue(Where... where, const Dstring& name, float& value, ConditionList& list);
  static int GetValue(Where... where, const Dstring& name, double& value, ConditionList& list);
  static int GetValue(Where... where, const Dstring& name, Dstring& value, ConditionList& list);
  static int GetValue(Where... where, const Dstring& name, DataParcel& value, ConditionList& list);
  static int GetValue(Where... where, const Dstring& name, LispList& value, ConditionList& list);

  static int SetValue(Where... where, const Dstring& name, long value, ConditionList& list);
  static int SetValue(Where... where, const Dstring& name, unsigned long value, ConditionList& list);
  static int SetValue(Where... where, const Dstring& name, float value, ConditionList& list);
  static int SetValue(Where... where, const Dstring& name, double value, ConditionList& list);
  static int SetValue(Where... where, const Dstring& name, const Dstring& value, ConditionList& list);
  static int SetValue(Where... where, const Dstring& name, const DataParcel& value, ConditionList& list);
  static int SetValue(Where... where, const Dstring& name, const LispList& value, ConditionList& list);

 private:
  template <typename T>
  static int SetNumber(Where... where, const Dstring& name, T value, ConditionList& list);
};

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::GetValue(Where... where, const Dstring& name, long& value,
                                              ConditionList& list) {
  return Profile::GetTyped(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::GetValue(Where... where, const Dstring& name, unsigned long& value,
                                              ConditionList& list) {
  return Profile::GetTyped(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::GetValue(Where... where, const Dstring& name, float& value,
                                              ConditionList& list) {
  return Profile::GetTyped(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::GetValue(Where... where, const Dstring& name, double& value,
                                              ConditionList& list) {
  return Profile::GetTyped(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::GetValue(Where... where, const Dstring& name, Dstring& value,
                                              ConditionList& list) {
  return Profile::GetTyped(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::GetValue(Where... where, const Dstring& name, DataParcel& value,
                                              ConditionList& list) {
  return Profile::GetTyped(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::GetValue(Where... where, const Dstring& name, LispList& value,
                                              ConditionList& list) {
  return Profile::GetTyped(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::SetValue(Where... where, const Dstring& name, long value,
                                              ConditionList& list) {
  return SetNumber(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::SetValue(Where... where, const Dstring& name, unsigned long value,
                                              ConditionList& list) {
  return SetNumber(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::SetValue(Where... where, const Dstring& name, float value,
                                              ConditionList& list) {
  return SetNumber(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::SetValue(Where... where, const Dstring& name, double value,
                                              ConditionList& list) {
  return SetNumber(where..., name, value, list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::SetValue(Where... where, const Dstring& name, const Dstring& value,
                                              ConditionList& list) {
  return Profile::Put(where..., name, Profile::TextValue(value), list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::SetValue(Where... where, const Dstring& name, const DataParcel& value,
                                              ConditionList& list) {
  return Profile::Put(where..., name, ProfileValue::Format(value), list);
}

template <typename Profile, typename... Where>
int TypedProfile<Profile, Where...>::SetValue(Where... where, const Dstring& name, const LispList& value,
                                              ConditionList& list) {
  return Profile::Put(where..., name, ProfileValue::Format(value), list);
}

template <typename Profile, typename... Where>
template <typename T>
int TypedProfile<Profile, Where...>::SetNumber(Where... where, const Dstring& name, T value,
                                               ConditionList& list) {
  if constexpr (std::is_floating_point_v<T>) {
    if (int status = ProfileValue::CheckFinite(value, name, list)) return status;
  }
  return Profile::Put(where..., name, ProfileValue::Format(value, Profile::kParens), list);
}
