#pragma once

#include "instrument/QenInstrument.h"
#include "support/ConditionList.h"

// The application handle: the first path element of every command, handed out by the server.
class AppHandle {
 public:
  // "_" and the resource name, at most 12 characters, never ending in a digit: a final digit
  // gets an "X" (cutting to 11 first when the text is exactly 12 long). A longer text with a
  // final digit keeps 12 characters and gets the "X", giving 13; that asymmetry is kept.
  static Dstring MakeFromResourceName(const Dstring& resource);
  // Sends ":QEN:INST:HAND:CRE? <handle>,"PSX","<resource>""; on success the reply replaces
  // `handle` (the server may hand out a variant of the proposal).
  static int Create(QenInstrument* instrument, Dstring& handle, const Dstring& resource, ConditionList& list);
  static int Destroy(QenInstrument* instrument, const Dstring& handle, ConditionList& list);
};
