#include "SimScpiHeader.h"

#include "support/DstringList.h"

namespace {

// Long forms: the upper-case letters are the short form. A short form may have more than one
// (`STATe`, `STATus`); none is spelt like another node's short form (`DELAY` stays itself).
constexpr const char* kLongForms[] = {
    "AMPLitude", "ATTRibute",  "CAPTure",   "CATalog",   "CENTral",   "CGRoup",     "CHANnel",   "CLOSe",
    "CODing",    "CONDition",  "CONFigure", "CONNect",   "CONTinuous", "CONVert",   "COUNt",     "CREate",
    "DEPTh",     "DESTroy",    "DIVider",   "ENABle",    "ERRor",     "EVENt",      "EXISts",    "EXPRession",
    "FIRSt",     "FORCe",      "FREQuency", "FRONtend",  "GLOBal",    "HANDle",     "INITiate",  "INJect",
    "INSert",    "INSTrument", "INVert",    "LENGth",    "MALFormed", "MEASure",    "MEMory",    "MIRRor",
    "MMEMory",   "MODule",     "MODify",    "OFFSet",    "OPERation", "OUTPut",     "PATTern",   "PERiod",
    "PREVious",  "PROFile",    "PULSe",     "QUEStionable", "SEGMent", "SEQuence",  "SETTing",   "SGENerator",
    "STATe",     "STATus",     "SYSTem",    "THReshold", "TRIGger",   "VERSion",    "VOLTage",   "WIDTh",
};

// Optional nodes: the full header, and what it means without them.
struct Optional {
  const char* full;
  const char* shortest;
};
constexpr Optional kOptional[] = {
    {"SYST:ERR:NEXT", "SYST:ERR"},
    {"STAT:OPER:EVEN", "STAT:OPER"},
    {"STAT:QUES:EVEN", "STAT:QUES"},
};

Dstring ShortOf(const Dstring& node) {
  for (const char* form : kLongForms) {
    if (node != Dstring(form).ToUpper()) continue;
    Dstring shortForm;
    for (const char* c = form; *c >= 'A' && *c <= 'Z'; ++c) shortForm += *c;
    return shortForm;
  }
  return node;
}

// A node with its numeric suffix: only the letters before the suffix are a mnemonic.
Dstring CanonicalNode(const Dstring& node) {
  std::size_t digits = node.size();
  while (digits > 0 && node[digits - 1] >= '0' && node[digits - 1] <= '9') --digits;
  return ShortOf(node.substr(0, digits)) + node.substr(digits);
}

}  // namespace

Dstring SimScpiHeader::Canonical(std::string_view header) {
  const bool query = header.ends_with('?');
  if (query) header.remove_suffix(1);
  if (header.starts_with(':')) header.remove_prefix(1);
  DstringList nodes = DstringList::Split(Dstring(header).ToUpper(), ':');
  for (Dstring& node : nodes) node = CanonicalNode(node);
  Dstring out = nodes.Join(":");
  for (const Optional& o : kOptional) {
    if (out == o.full) out = o.shortest;
  }
  return query ? out + "?" : out;
}
