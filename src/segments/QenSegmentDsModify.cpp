// The commands that change a segment on the server, the clipboard, and the searches.
#include <climits>

#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "segments/QenSegmentDs.h"
#include "segments/SegmentBuffer.h"
#include "segments/SegmentKeywords.h"
#include "segments/SegmentReply.h"
#include "segments/SegmentStatus.h"
#include "support/FWBlocker.h"

namespace {

Dstring RangeText(const StateRange& r) {
  return Dstring::Format("%ld,%ld,%ld,%ld", r.GetFirstTrace(), r.GetFirstVector(), r.GetLastTrace(),
                         r.GetLastVector());
}

// The keyword of an enumeration value, or a condition when the value is outside it.
int WordFor(const char* word, const char* what, int value, Dstring& out, ConditionList& list) {
  if (*word != '\0') {
    out = word;
    return SegmentStatus::kOk;
  }
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_ARGUMENT", {what, Dstring::Format("%d", value)},
                              SegmentStatus::kBadArgument);
}

template <typename E>
int WordOf(E value, const char* what, Dstring& out, ConditionList& list) {
  return WordFor(SegmentKeywords::Word(value), what, static_cast<int>(value), out, list);
}

}  // namespace

int QenSegmentDs::ModifyRange(const char* command, const StateRange& range, const Dstring& extra,
                              ConditionList& list) {
  const Dstring cmd =
      Cmd(Dstring::Format(":PATT:MOD:%s %s%s", command, RangeText(range).c_str(), extra.c_str()).c_str());
  return Modify({cmd}, kStatesChanged, false, list, &range);
}

int QenSegmentDs::ModifyFill(const StateRange& range, long state, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ModifyFill", list);
  if (int status = guard.Block()) return status;
  return ModifyRange("FILL", range, Dstring::Format(",%ld", state), list);
}

int QenSegmentDs::ModifyInvert(const StateRange& range, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ModifyInvert", list);
  if (int status = guard.Block()) return status;
  return ModifyRange("INV", range, "", list);
}

int QenSegmentDs::ModifyMirror(const StateRange& range, MirrorMode mode, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ModifyMirror", list);
  if (int status = guard.Block()) return status;
  Dstring word;
  if (int status = WordOf(mode, "MirrorMode", word, list)) return status;
  return ModifyRange("MIRR", range, "," + word, list);
}

int QenSegmentDs::ModifyCopy(const StateRange& range, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ModifyCopy", list);
  if (int status = guard.Block()) return status;
  if (int status = CheckOpen(list)) return status;
  // The clipboard gets what the user sees, unsaved edits included.
  if (int status = Write(list)) return status;
  return Send(Cmd(Dstring::Format(":PATT:MOD:COPY %s", RangeText(range).c_str()).c_str()), list);
}

int QenSegmentDs::ModifyPaste(long trace, long vector, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ModifyPaste", list);
  if (int status = guard.Block()) return status;
  return Modify({Cmd(Dstring::Format(":PATT:MOD:PASTE %ld,%ld,RVS", trace, vector).c_str())}, kStatesChanged,
                false, list);
}

int QenSegmentDs::ModifyInsert(long position, VectorTrace which, InsertMode mode, long count,
                               ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ModifyInsert", list);
  if (int status = guard.Block()) return status;
  Dstring whichWord, modeWord;
  if (int status = WordOf(which, "VectorTrace", whichWord, list)) return status;
  if (int status = WordOf(mode, "InsertMode", modeWord, list)) return status;
  const Dstring cmd =
      Cmd(Dstring::Format(":PATT:MOD:INS %ld,%s,%s,%ld", position, whichWord.c_str(), modeWord.c_str(), count)
              .c_str());
  return Modify({cmd}, which == VectorTrace::kVector ? kLengthChanged : kWidthChanged, true, list);
}

int QenSegmentDs::ModifyDelete(long position, VectorTrace which, long count, DeleteMode mode,
                               ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ModifyDelete", list);
  if (int status = guard.Block()) return status;
  Dstring whichWord, modeWord;
  if (int status = WordOf(which, "VectorTrace", whichWord, list)) return status;
  if (int status = WordOf(mode, "DeleteMode", modeWord, list)) return status;
  const Dstring cmd =
      Cmd(Dstring::Format(":PATT:MOD:DEL %ld,%s,%ld,%s", position, whichWord.c_str(), count, modeWord.c_str())
              .c_str());
  return Modify({cmd}, which == VectorTrace::kVector ? kLengthChanged : kWidthChanged, true, list);
}

int QenSegmentDs::ModifySerialize(Direction direction, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ModifySerialize", list);
  if (int status = guard.Block()) return status;
  Dstring word;
  if (int status = WordOf(direction, "Direction", word, list)) return status;
  return Modify({Cmd((":PATT:MOD:SER " + word).c_str())}, kSerialized, true, list);
}

int QenSegmentDs::ModifyDeserialize(long width, long offset, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ModifyDeserialize", list);
  if (int status = guard.Block()) return status;
  return Modify({Cmd(Dstring::Format(":PATT:MOD:DES %ld,%ld", width, offset).c_str())}, kSerialized, true,
                list);
}

namespace {

Dstring ClipCmd(const char* tail) {
  return QenGuiInst::GetAppHandle() + ":EDIT:SEGM:PATT:CLIP" + tail;
}

}  // namespace

int QenSegmentDs::GetClipBoardWidth(long& width, ConditionList& list) {
  return QueryNumber(ClipCmd(":WIDT?"), width, list);
}

int QenSegmentDs::GetClipBoardLength(long& length, ConditionList& list) {
  return QueryNumber(ClipCmd(":LENG?"), length, list);
}

int QenSegmentDs::GetClipBoardCoding(Dstring& coding, ConditionList& list) {
  Dstring reply;
  if (int status = Query(ClipCmd(":COD?"), reply, list)) return status;
  if (SegmentReply::FirstItemText(reply, coding)) return SegmentStatus::kOk;
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_CLIPBOARDCODING", {SegmentReply::Shown(reply)},
                              SegmentStatus::kBadReply);
}

// Possible when the clipboard holds states, they fit at (trace, vector), and every state of
// the clipboard's coding is one of this segment's.
int QenSegmentDs::IsPastePossible(long trace, long vector, bool& possible, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::IsPastePossible", list);
  if (int status = guard.Block()) return status;
  const Dstring cmd = ClipCmd("?");
  Dstring reply, clipCoding, coding;
  bool filled = false;
  if (int status = Query(cmd, reply, list)) return status;
  if (!SegmentReply::Truth(reply, filled)) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_REPLY", {cmd, SegmentReply::Shown(reply)},
                                SegmentStatus::kBadReply);
  }
  long clipWidth = 0, clipLength = 0, width = 0, length = 0;
  if (filled) {
    if (int status = GetClipBoardWidth(clipWidth, list)) return status;
    if (int status = GetClipBoardLength(clipLength, list)) return status;
    if (int status = GetClipBoardCoding(clipCoding, list)) return status;
    if (int status = GetWidth(width, list)) return status;
    if (int status = GetLength(length, list)) return status;
    if (int status = GetCoding(coding, list)) return status;
  }
  possible = filled && trace >= 0 && vector >= 0 && trace + clipWidth <= width &&
             vector + clipLength <= length && clipCoding.find_first_not_of(coding) == Dstring::npos;
  return SegmentStatus::kOk;
}

int QenSegmentDs::PositionQuery(const Dstring& cmd, long& vector, long& trace, ConditionList& list) {
  if (int status = CheckOpen(list)) return status;
  // The search runs on the server's data, so it gets the user's unsaved edits first.
  if (int status = Write(list)) return status;
  Dstring reply;
  if (int status = Query(cmd, reply, list)) return status;
  if (SegmentReply::Position(reply, trace, vector)) return SegmentStatus::kOk;
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_REPLY", {cmd, SegmentReply::Shown(reply)},
                              SegmentStatus::kBadReply);
}

int QenSegmentDs::FindPattern(long& vector, long& trace, long startVector, long startTrace,
                              const Dstring& pattern, DataFormat format, FindDirection direction,
                              VectorTrace which, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::FindPattern", list);
  if (int status = guard.Block()) return status;
  if (int status = CommandText::CheckArgument(pattern, list)) return status;
  Dstring whichWord, command;
  if (int status = WordOf(which, "VectorTrace", whichWord, list)) return status;
  const char* findWord = SegmentKeywords::FindCommand(direction);
  if (int status = WordFor(findWord, "FindDirection", static_cast<int>(direction), command, list))
    return status;
  const DataFormatInfo& info = InfoOf(format);
  if (info.tracesPerDigit == 0) return WordFor("", "DataFormat", static_cast<int>(format), command, list);
  if (!IsPatternOf(pattern, format)) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_PATTERN", {pattern, info.name, info.digitsText},
                                SegmentStatus::kBadArgument);
  }
  const Dstring number = pattern + info.suffix;
  const Dstring tail =
      direction == FindDirection::kFirst
          ? Dstring::Format(":PATT:%s \"%s\", %s, RVS", command.c_str(), number.c_str(), whichWord.c_str())
          : Dstring::Format(":PATT:%s %ld, %ld, \"%s\", %s, RVS", command.c_str(), startTrace, startVector,
                            number.c_str(), whichWord.c_str());
  return PositionQuery(Cmd(tail.c_str()), vector, trace, list);
}

int QenSegmentDs::GetFirstError(long& vector, long& trace, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::GetFirstError", list);
  if (int status = guard.Block()) return status;
  return PositionQuery(Cmd(":PATT:ERR:FIRS? RVS"), vector, trace, list);
}

int QenSegmentDs::GetNextError(long& vector, long& trace, long startVector, long startTrace,
                               ConditionList& list) {
  FWBlocker guard("QenSegmentDs::GetNextError", list);
  if (int status = guard.Block()) return status;
  const Dstring tail = Dstring::Format(":PATT:ERR:NEXT? %ld,%ld,RVS", startTrace, startVector);
  return PositionQuery(Cmd(tail.c_str()), vector, trace, list);
}

int QenSegmentDs::GetPrevError(long& vector, long& trace, long startVector, long startTrace,
                               ConditionList& list) {
  FWBlocker guard("QenSegmentDs::GetPrevError", list);
  if (int status = guard.Block()) return status;
  const Dstring tail = Dstring::Format(":PATT:ERR:PREV? %ld,%ld,RVS", startTrace, startVector);
  return PositionQuery(Cmd(tail.c_str()), vector, trace, list);
}
