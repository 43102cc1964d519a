#include "capture/CaptureReader.h"

#include <algorithm>
#include <cstdlib>

#include "instrument/QenGuiInst.h"
#include "segments/SegmentReply.h"
#include "support/ConditionListLoader.h"
#include "support/DataParcel.h"
#include "support/FWBlocker.h"
#include "support/ParserExpression.h"

long CaptureReader::BlockVectors(long width) {
  return std::max(64L, kMaxBlockBytes * 8 / std::max(width, 1L) / 64 * 64);
}

int CaptureReader::Ask(const Dstring& what, Dstring& reply, ConditionList& list) {
  return QenGuiInst::Call(":" + QenGuiInst::GetAppHandle() + what, reply, list);
}

int CaptureReader::BadReply(const Dstring& what, const Dstring& reply, ConditionList& list) {
  ConditionListLoader::ConditionToken(list, "GUI_STATE_BAD_REPLY",
                                      {":" + QenGuiInst::GetAppHandle() + what, SegmentReply::Shown(reply)}, 1);
  return 1;
}

int CaptureReader::Read(const Dstring& port, CaptureData& out, ConditionList& list) {
  FWBlocker guard("CaptureReader::Read", list);
  if (int status = guard.Block()) return status;
  out.Reset(0, 0, 0);
  Dstring reply;
  DataParcel items;
  ConditionList ignored;
  const Dstring sizeQuery = port + ":CAPT:SIZE?";
  if (int status = Ask(sizeQuery, reply, list)) return status;
  long length = 0, width = 0;
  if (ParserExpression::Parse(reply, items, ignored) != 0 || items.size() != 2 || !items[0].GetLong(length) ||
      !items[1].GetLong(width) || length < 0 || width < 0 || (length > 0) != (width > 0)) {
    return BadReply(sizeQuery, reply, list);
  }
  // The clock group's period, for times between vectors.
  const Dstring periodQuery = Dstring::Format(":CGR%ld:PER?", std::strtol(port.c_str() + 4, nullptr, 10));
  double period = 0;
  if (int status = Ask(periodQuery, reply, list)) return status;
  items.clear();
  if (ParserExpression::Parse(reply, items, ignored) != 0 || items.size() != 1 || !items[0].GetDouble(period) ||
      !(period > 0)) {
    return BadReply(periodQuery, reply, list);
  }
  out.Reset(width, length, period);
  const long step = BlockVectors(width);
  for (long start = 0; start < length; start += step) {
    const long count = std::min(step, length - start);
    for (bool errors : {false, true}) {
      const Dstring query = port + (errors ? ":CAPT:ERR? " : ":CAPT:DATA? ") + Dstring::Format("%ld,%ld", start, count);
      if (int status = Ask(query, reply, list)) {
        out.Reset(0, 0, 0);
        return status;
      }
      items.clear();
      if (ParserExpression::Parse(reply, items, ignored) != 0 || items.size() != 1 ||
          items[0].GetType() != DataItemType::Block ||
          !out.Put(start, count, items[0].GetText(), errors)) {
        out.Reset(0, 0, 0);
        return BadReply(query, reply, list);
      }
    }
  }
  out.Summarise();
  return 0;
}
