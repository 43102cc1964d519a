// The type of a segment, the parameters of its pseudo-random generator and SFI5 framing, and
// the properties record built from them.
#include <climits>

#include "instrument/CommandText.h"
#include "segments/QenSegmentDs.h"
#include "segments/SegmentKeywords.h"
#include "segments/SegmentReply.h"
#include "segments/SegmentStatus.h"
#include "support/FWBlocker.h"

namespace {

constexpr const char* kPolynom = "_Polynom";
constexpr const char* kLogic = "_Logic";
constexpr const char* kSubType = "_PRxSType";
constexpr const char* kWhich = "_Which";
constexpr const char* kErrors = "_Errors";
constexpr const char* kDensity = "_Density";
constexpr const char* kNumber = "_Number";
constexpr const char* kRotating = "_Rotating";
constexpr const char* kBase = "_Base";
constexpr const char* kExpansionHeader = "_ExpansionHeader";
constexpr const char* kFramingBytes = "_FramingBytes";

constexpr const char* kDigits = "0123456789abcdef";

int Bad(ConditionList& list, const char* key, const Dstring& reply) {
  return SegmentReply::Refuse(list, key, {SegmentReply::Shown(reply)}, SegmentStatus::kBadReply);
}

int BadArgument(ConditionList& list, const char* what, const Dstring& value) {
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_ARGUMENT", {what, value}, SegmentStatus::kBadArgument);
}

Dstring Quoted(const Dstring& text) {
  return "\"" + text + "\"";
}

// Bits per digit of the bases whose digits map onto whole bits; 0 for any other base.
int BitsOfBase(long base) {
  switch (base) {
    case 2:
      return 1;
    case 4:
      return 2;
    case 8:
      return 3;
    case 16:
      return 4;
    default:
      return 0;
  }
}

// The value of a digit character in `base`, or -1.
int DigitValue(char c, long base) {
  const char lower = static_cast<char>(c >= 'A' && c <= 'F' ? c - 'A' + 'a' : c);
  const char* at = std::char_traits<char>::find(kDigits, 16, lower);
  const int value = at == nullptr ? -1 : static_cast<int>(at - kDigits);
  return value < base ? value : -1;
}

// A text-valued generator parameter read into `out`; `key` names the reply of the wrong shape.
template <typename E>
int ReadKeyword(const Dstring& reply, const char* badKey, const char* unknownKey, E& out,
                ConditionList& list) {
  Dstring word;
  if (!SegmentReply::FirstText(reply, word)) return Bad(list, badKey, reply);
  if (!SegmentKeywords::From(word, out)) return Bad(list, unknownKey, word);
  return SegmentStatus::kOk;
}

}  // namespace

int QenSegmentDs::SetParam(const char* name, const Dstring& value, ConditionList& list) {
  const Dstring cmd = Cmd(Dstring::Format(":PARA \"%s\",(%s)", name, value.c_str()).c_str());
  return Modify({cmd}, kTypeChanged, true, list);
}

int QenSegmentDs::GetParam(const char* name, Dstring& reply, ConditionList& list) {
  if (int status = CheckOpen(list)) return status;
  return Query(Cmd(Dstring::Format(":PARA? \"%s\"", name).c_str()), reply, list);
}

int QenSegmentDs::SetType(SegmentType type, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetType", list);
  if (int status = guard.Block()) return status;
  const char* word = SegmentKeywords::Word(type);
  if (*word == '\0') return BadArgument(list, "SegmentType", Dstring::Format("%d", static_cast<int>(type)));
  return Modify({Cmd((Dstring(":TYPE ") + word).c_str())}, kTypeChanged, true, list);
}

int QenSegmentDs::GetType(SegmentType& type, ConditionList& list) {
  if (int status = CheckOpen(list)) return status;
  Dstring reply, word;
  if (int status = Query(Cmd(":TYPE?"), reply, list)) return status;
  if (!SegmentReply::FirstText(reply, word) || !SegmentKeywords::From(word, type)) {
    return Bad(list, "GUI_SEGMENTDS_BAD_TYPE", reply);
  }
  return SegmentStatus::kOk;
}

int QenSegmentDs::SetPRxSPolynom(const Dstring& polynomial, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetPRxSPolynom", list);
  if (int status = guard.Block()) return status;
  if (int status = CommandText::CheckArgument(polynomial, list)) return status;
  return SetParam(kPolynom, Quoted(polynomial), list);
}

int QenSegmentDs::GetPRxSPolynom(Dstring& polynomial, ConditionList& list) {
  Dstring reply;
  if (int status = GetParam(kPolynom, reply, list)) return status;
  if (!SegmentReply::FirstText(reply, polynomial)) return Bad(list, "GUI_SEGMENTDS_BAD_PRXSPOLYNOM", reply);
  return SegmentStatus::kOk;
}

int QenSegmentDs::SetPRxSLogic(PRxSLogic logic, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetPRxSLogic", list);
  if (int status = guard.Block()) return status;
  const char* word = SegmentKeywords::Word(logic);
  if (*word == '\0') return BadArgument(list, "PRxSLogic", Dstring::Format("%d", static_cast<int>(logic)));
  return SetParam(kLogic, word, list);
}

int QenSegmentDs::GetPRxSLogic(PRxSLogic& logic, ConditionList& list) {
  Dstring reply;
  if (int status = GetParam(kLogic, reply, list)) return status;
  return ReadKeyword(reply, "GUI_SEGMENTDS_BAD_PRXSLOGIC", "GUI_SEGMENTDS_UNKNOWN_PRXSLOGIC", logic, list);
}

// The extended kinds also say which run they extend.
int QenSegmentDs::SetPRxSSubType(PRxSSubType subType, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetPRxSSubType", list);
  if (int status = guard.Block()) return status;
  const char* word = SegmentKeywords::Word(subType);
  if (*word == '\0')
    return BadArgument(list, "PRxSSubType", Dstring::Format("%d", static_cast<int>(subType)));
  DstringList cmds = {Cmd(Dstring::Format(":PARA \"%s\",(%s)", kSubType, word).c_str())};
  const char* extension = SegmentKeywords::ExtensionWord(subType);
  if (*extension != '\0')
    cmds.push_back(Cmd(Dstring::Format(":PARA \"%s\",(%s)", kWhich, extension).c_str()));
  return Modify(cmds, kTypeChanged, true, list);
}

int QenSegmentDs::GetPRxSSubType(PRxSSubType& subType, ConditionList& list) {
  Dstring reply;
  PRxSSubType read = PRxSSubType::kPure;
  if (int status = GetParam(kSubType, reply, list)) return status;
  if (int status = ReadKeyword(reply, "GUI_SEGMENTDS_BAD_PRXSSUBTYPE", "GUI_SEGMENTDS_UNKNOWN_PRXSSUBTYPE",
                               read, list))
    return status;
  if (read == PRxSSubType::kExtendedZero) {
    Dstring word;
    if (int status = GetParam(kWhich, reply, list)) return status;
    if (!SegmentReply::FirstText(reply, word)) return Bad(list, "GUI_SEGMENTDS_BAD_PRXSEXTENSION", reply);
    if (!SegmentKeywords::FromExtension(word, read))
      return Bad(list, "GUI_SEGMENTDS_UNKNOWN_PRXSEXTENSION", word);
  }
  subType = read;
  return SegmentStatus::kOk;
}

int QenSegmentDs::SetPRxSErrors(long errors, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetPRxSErrors", list);
  if (int status = guard.Block()) return status;
  if (errors < 0 || errors > INT_MAX) return BadArgument(list, kErrors, Dstring::Format("%ld", errors));
  return SetParam(kErrors, Dstring::Format("%ld", errors), list);
}

int QenSegmentDs::GetPRxSErrors(long& errors, ConditionList& list) {
  Dstring reply;
  if (int status = GetParam(kErrors, reply, list)) return status;
  if (!SegmentReply::FirstNumber(reply, 0, INT_MAX, errors))
    return Bad(list, "GUI_SEGMENTDS_BAD_PRXSERRORS", reply);
  return SegmentStatus::kOk;
}

int QenSegmentDs::SetPRxSDensity(PRxSDensity density, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetPRxSDensity", list);
  if (int status = guard.Block()) return status;
  const char* word = SegmentKeywords::Word(density);
  if (*word == '\0')
    return BadArgument(list, "PRxSDensity", Dstring::Format("%d", static_cast<int>(density)));
  return SetParam(kDensity, Quoted(word), list);
}

int QenSegmentDs::GetPRxSDensity(PRxSDensity& density, ConditionList& list) {
  Dstring reply;
  if (int status = GetParam(kDensity, reply, list)) return status;
  return ReadKeyword(reply, "GUI_SEGMENTDS_BAD_PRXSDENSITY", "GUI_SEGMENTDS_UNKNOWN_PRXSDENSITY", density,
                     list);
}

int QenSegmentDs::SetPRxSExtensionNumber(long number, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetPRxSExtensionNumber", list);
  if (int status = guard.Block()) return status;
  if (number < 0 || number > INT_MAX) return BadArgument(list, kNumber, Dstring::Format("%ld", number));
  return SetParam(kNumber, Dstring::Format("%ld", number), list);
}

int QenSegmentDs::GetPRxSExtensionNumber(long& number, ConditionList& list) {
  Dstring reply;
  if (int status = GetParam(kNumber, reply, list)) return status;
  if (!SegmentReply::FirstNumber(reply, 0, INT_MAX, number)) {
    return Bad(list, "GUI_SEGMENTDS_BAD_PRXSEXTENSIONNUMBER", reply);
  }
  return SegmentStatus::kOk;
}

int QenSegmentDs::SetPRxSRotating(ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetPRxSRotating", list);
  if (int status = guard.Block()) return status;
  return SetParam(kRotating, "", list);
}

// The base goes first, so that the server reads the two headers in it.
int QenSegmentDs::SetSFI5Headers(const Dstring& expansionHeader, const Dstring& framingBytes, long base,
                                 ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetSFI5Headers", list);
  if (int status = guard.Block()) return status;
  if (int status = CommandText::CheckArgument(expansionHeader + framingBytes, list)) return status;
  if (BitsOfBase(base) == 0) return BadArgument(list, kBase, Dstring::Format("%ld", base));
  const char* format = ":PARA \"%s\",(\"%s\")";
  const DstringList cmds = {Cmd(Dstring::Format(format, kBase, Dstring::Format("%ld", base).c_str()).c_str()),
                            Cmd(Dstring::Format(format, kExpansionHeader, expansionHeader.c_str()).c_str()),
                            Cmd(Dstring::Format(format, kFramingBytes, framingBytes.c_str()).c_str())};
  return Modify(cmds, kTypeChanged, true, list);
}

int QenSegmentDs::GetSFI5Headers(Dstring& expansionHeader, Dstring& framingBytes, long& base,
                                 ConditionList& list) {
  Dstring reply, header, framing, baseText;
  long number = 0;
  if (int status = GetParam(kExpansionHeader, reply, list)) return status;
  if (!SegmentReply::FirstText(reply, header)) return Bad(list, "GUI_SEGMENTDS_BAD_SFI5EXPHEADER", reply);
  if (int status = GetParam(kFramingBytes, reply, list)) return status;
  if (!SegmentReply::FirstText(reply, framing)) return Bad(list, "GUI_SEGMENTDS_BAD_SFI5FRAMING", reply);
  if (int status = GetParam(kBase, reply, list)) return status;
  if (!SegmentReply::FirstText(reply, baseText) || !baseText.ToLong(number) || BitsOfBase(number) == 0) {
    return Bad(list, "GUI_SEGMENTDS_BAD_SFI5BASE", reply);
  }
  // The headers must be written in the base they come with.
  for (char c : header + framing) {
    if (DigitValue(c, number) < 0)
      return Bad(list, "GUI_SEGMENTDS_BAD_SFI5INFO", header + "," + framing + "," + baseText);
  }
  expansionHeader = header;
  framingBytes = framing;
  base = number;
  return SegmentStatus::kOk;
}

int QenSegmentDs::ConvertBase(const Dstring& text, long from, long to, Dstring& out, ConditionList& list) {
  const int fromBits = BitsOfBase(from), toBits = BitsOfBase(to);
  if (fromBits == 0) return BadArgument(list, kBase, Dstring::Format("%ld", from));
  if (toBits == 0) return BadArgument(list, kBase, Dstring::Format("%ld", to));
  Dstring bits;
  for (char c : text) {
    const int value = DigitValue(c, from);
    if (value < 0) return BadArgument(list, "ConvertBase", text);
    for (int b = fromBits - 1; b >= 0; --b) bits += ((value >> b) & 1) ? '1' : '0';
  }
  bits.insert(0, (toBits - bits.size() % toBits) % toBits, '0');
  Dstring converted;
  for (std::size_t i = 0; i < bits.size(); i += static_cast<std::size_t>(toBits)) {
    int value = 0;
    for (int b = 0; b < toBits; ++b) value = (value << 1) | (bits[i + static_cast<std::size_t>(b)] - '0');
    converted += kDigits[value];
  }
  out = converted;
  return SegmentStatus::kOk;
}

// The pseudo-random fields are asked only of the segments in the generator folders; the first
// failure stops the rest.
int QenSegmentDs::GetProperties(SegmentProperties& properties, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::GetProperties", list);
  if (int status = guard.Block()) return status;
  properties.name = mName;
  if (int status = GetType(properties.type, list)) return status;
  if (int status = GetCoding(properties.coding, list)) return status;
  if (int status = GetWidth(properties.width, list)) return status;
  if (int status = GetLength(properties.length, list)) return status;
  if (!mName.StartsWith("GlobalSegments") && !mName.StartsWith("LocalSegments")) return SegmentStatus::kOk;
  return GetGeneratorProperties(properties, list);
}

int QenSegmentDs::GetGeneratorProperties(SegmentProperties& p, ConditionList& list) {
  if (int status = GetPRxSPolynom(p.polynomial, list)) return status;
  if (int status = GetPRxSLogic(p.logic, list)) return status;
  if (int status = GetPRxSSubType(p.subType, list)) return status;
  if (int status = GetPRxSErrors(p.errorCount, list)) return status;
  if (int status = GetPRxSDensity(p.density, list)) return status;
  if (int status = GetPRxSExtensionNumber(p.extensionNumber, list)) return status;
  return GetSFI5Headers(p.sfi5ExpansionHeader, p.sfi5FramingBytes, p.sfi5Base, list);
}

// Memory data get their coding and dimensions (contents afresh); the generated types their
// generator, then the one value their kind needs.
int QenSegmentDs::SetProperties(const SegmentProperties& properties, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetProperties", list);
  if (int status = guard.Block()) return status;
  if (int status = SetType(properties.type, list)) return status;
  if (properties.type == SegmentType::kMemory) {
    if (int status = SetCoding(properties.coding, list)) return status;
    if (int status = SetLength(properties.length, list)) return status;
    return SetWidth(properties.width, list);
  }
  return SetGeneratorProperties(properties, list);
}

int QenSegmentDs::SetGeneratorProperties(const SegmentProperties& p, ConditionList& list) {
  if (int status = SetPRxSPolynom(p.polynomial, list)) return status;
  if (int status = SetPRxSLogic(p.logic, list)) return status;
  if (int status = SetPRxSSubType(p.subType, list)) return status;
  if (int status = SetPRxSRotating(list)) return status;
  switch (p.subType) {
    case PRxSSubType::kPure:
      return p.type == SegmentType::kSfi5
                 ? SetSFI5Headers(p.sfi5ExpansionHeader, p.sfi5FramingBytes, p.sfi5Base, list)
                 : SegmentStatus::kOk;
    case PRxSSubType::kErrored:
      return SetPRxSErrors(p.errorCount, list);
    case PRxSSubType::kDensity:
      return SetPRxSDensity(p.density, list);
    case PRxSSubType::kExtendedZero:
    case PRxSSubType::kExtendedOne:
      return SetPRxSExtensionNumber(p.extensionNumber, list);
  }
  return SegmentStatus::kOk;
}
