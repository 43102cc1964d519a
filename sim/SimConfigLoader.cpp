#include "SimConfigLoader.h"

#include <cctype>
#include <map>
#include <set>

namespace {

struct Line {
  int number = 0;
  DstringList words;
};

enum class Scope { Group, Module, Port };

struct Template {
  int line = 0;
  Scope scope = Scope::Group;
  DstringList kinds;
  DstringList models;
  DstringList types;
  std::vector<Line> lines;
};

struct Port {
  unsigned long number = 0;
  Dstring type;
};

struct Module {
  unsigned long number = 0;
  Dstring model;
  unsigned long slot = 0;
  std::vector<Port> ports;
};

struct Group {
  unsigned long number = 0;
  std::vector<Module> modules;
};

using Placeholders = std::map<Dstring, Dstring>;

// Splits a line into blank-separated words; a double-quoted word keeps its quotes and blanks,
// and "#" outside quotes starts a comment.
bool Tokenize(const Dstring& text, DstringList& words) {
  Dstring word;
  bool quoted = false;
  for (char c : text) {
    if (!quoted && c == '#') break;
    if (c == '"') quoted = !quoted;
    if (!quoted && std::isspace(static_cast<unsigned char>(c))) {
      if (!word.empty()) words.push_back(word);
      word.clear();
      continue;
    }
    word += c;
  }
  if (!word.empty()) words.push_back(word);
  return !quoted;
}

bool ReadNumber(const Dstring& text, unsigned long& out) {
  return text.ToULong(out) && out > 0 && out < 1000;
}

// What a param line's options give besides the parameter itself.
struct ParamExtras {
  Dstring unit;
  int exponent = SimUnitAttr::kNotSet;  // "exp=": the prefix it is shown with, else the unit's
};

bool SetReadOnly(const Dstring&, SimParam& param, ParamExtras&) {
  param.SetReadOnly(true);
  return true;
}

bool SetRelock(const Dstring&, SimParam& param, ParamExtras&) {
  param.SetRelock(true);
  return true;
}

bool SetMin(const Dstring& value, SimParam& param, ParamExtras&) {
  double v = 0.0;
  if (!value.ToDouble(v)) return false;
  param.SetRange(v, param.GetHmax());
  return true;
}

bool SetMax(const Dstring& value, SimParam& param, ParamExtras&) {
  double v = 0.0;
  if (!value.ToDouble(v)) return false;
  param.SetRange(param.GetLmax(), v);
  return true;
}

bool SetResolution(const Dstring& value, SimParam& param, ParamExtras&) {
  double v = 0.0;
  if (!value.ToDouble(v) || v <= 0.0) return false;
  param.SetResolution(v);
  return true;
}

bool SetUnit(const Dstring& value, SimParam&, ParamExtras& extras) {
  extras.unit = value;
  return !value.empty();
}

bool SetExponent(const Dstring& value, SimParam&, ParamExtras& extras) {
  long exp = 0;
  if (!value.ToLong(exp) || exp % 3 != 0 || exp < -12 || exp > 9) return false;
  extras.exponent = static_cast<int>(exp);
  return true;
}

bool SetValues(const Dstring& value, SimParam& param, ParamExtras&) {
  param.SetWords(DstringList::Split(value, '|'));
  return !value.empty();
}

struct ParamOption {
  const char* key;
  bool takesValue;
  bool (*set)(const Dstring& value, SimParam& param, ParamExtras& extras);
};

constexpr ParamOption kParamOptions[] = {
    {"readonly", false, SetReadOnly},
    {"relock", false, SetRelock},
    {"min", true, SetMin},
    {"max", true, SetMax},
    {"res", true, SetResolution},
    {"unit", true, SetUnit},
    {"exp", true, SetExponent},
    {"values", true, SetValues},
};

bool ListMatches(const DstringList& wanted, const Dstring& value) {
  return wanted.empty() || wanted.Contains(value);
}

class Reader {
 public:
  explicit Reader(SimParamTable& table) : mTable(table) {}
  bool ReadLine(int number, const Dstring& text);
  bool Finish();
  const Dstring& GetError() const { return mError; }

 private:
  using Handler = bool (Reader::*)(const Line&);
  struct Keyword {
    const char* word;
    Handler handler;
  };
  static const Keyword kKeywords[];

  bool Fail(const Line& line, const Dstring& message);
  bool OnModel(const Line& line);
  bool OnUnit(const Line& line);
  bool OnParam(const Line& line) { return AddParam(line, {}); }
  bool OnCouple(const Line& line);
  bool OnTemplate(const Line& line);
  bool OnGroup(const Line& line);
  bool OnModule(const Line& line);
  bool OnPort(const Line& line);
  bool InTemplate(const Line& line);
  bool ReadSelector(const Dstring& word, Template& t);

  bool AddParam(const Line& line, const Placeholders& names);
  bool ReadOption(const Line& line, const Dstring& option, SimParam& param, ParamExtras& extras);
  void SetDefaultAttr(SimParam& param, const ParamExtras& extras);
  bool ExpandGroup(const Group& g);
  bool ExpandModule(const Module& m, Placeholders names);
  bool Expand(Scope scope, const Placeholders& names, const Dstring& kind, const Dstring& model,
              const Dstring& type);
  bool Substitute(const Line& line, const Placeholders& names, Line& out);

  SimParamTable& mTable;
  Dstring mError;
  std::map<Dstring, Dstring> mModelKinds;
  std::map<Dstring, unsigned long> mModelTerminals;  // of each data port
  SimRack mRack;
  std::map<Dstring, SimUnitAttr> mUnits;
  std::vector<Template> mTemplates;
  bool mOpenTemplate = false;
  std::vector<Group> mGroups;
  std::vector<Line> mCouples;
};

const Reader::Keyword Reader::kKeywords[] = {
    {"model", &Reader::OnModel},   {"unit", &Reader::OnUnit},         {"param", &Reader::OnParam},
    {"couple", &Reader::OnCouple}, {"template", &Reader::OnTemplate}, {"group", &Reader::OnGroup},
    {"module", &Reader::OnModule}, {"port", &Reader::OnPort},
};

bool Reader::Fail(const Line& line, const Dstring& message) {
  mError = Dstring::Format("configuration line %d: %s", line.number, message.c_str());
  return false;
}

bool Reader::ReadLine(int number, const Dstring& text) {
  Line line{number, {}};
  if (!Tokenize(text, line.words)) return Fail(line, "unterminated quote");
  if (line.words.empty()) return true;
  if (mOpenTemplate) return InTemplate(line);
  for (const Keyword& k : kKeywords) {
    if (line.words[0] == k.word) return (this->*k.handler)(line);
  }
  return Fail(line, Dstring::Format("unknown keyword \"%s\"", line.words[0].c_str()));
}

bool Reader::InTemplate(const Line& line) {
  if (line.words[0] == "end" && line.words.size() == 1) {
    mOpenTemplate = false;
    return true;
  }
  if (line.words[0] != "param" && line.words[0] != "couple")
    return Fail(line, "a template holds only param and couple lines");
  mTemplates.back().lines.push_back(line);
  return true;
}

bool Reader::OnModel(const Line& line) {
  const DstringList& w = line.words;
  unsigned long terminals = 1;
  if (w.size() < 3 || w.size() > 4 || (w[2] != "generator" && w[2] != "analyser") ||
      (w.size() == 4 && !(w[3].StartsWith("terminals=") && ReadNumber(Dstring(w[3].substr(10)), terminals)))) {
    return Fail(line, "expected: model <code> generator|analyser [terminals=<1..999>]");
  }
  mModelKinds[w[1]] = w[2];
  mModelTerminals[w[1]] = terminals;
  return true;
}

bool Reader::OnUnit(const Line& line) {
  const DstringList& w = line.words;
  long minExp = 0, maxExp = 0, curExp = 0;
  double step = 0.0;
  if (w.size() != 6 || !w[2].ToLong(minExp) || !w[3].ToLong(maxExp) || !w[4].ToLong(curExp) ||
      !w[5].ToDouble(step)) {
    return Fail(line, "expected: unit <symbol> <minExp> <maxExp> <curExp> <step>");
  }
  SimUnitAttr attr(w[1], static_cast<int>(minExp), static_cast<int>(maxExp), static_cast<int>(curExp), step);
  if (attr.Check() != 0)
    return Fail(line, "exponents must be multiples of 3 in -12..9 and the step positive");
  mUnits[w[1]] = attr;
  return true;
}

bool Reader::OnCouple(const Line& line) {
  if (line.words.size() < 3) return Fail(line, "expected: couple <kind> <header> ...");
  mCouples.push_back(line);
  return true;
}

bool Reader::OnTemplate(const Line& line) {
  static const std::map<Dstring, Scope> kScopes = {
      {"group", Scope::Group}, {"module", Scope::Module}, {"port", Scope::Port}};
  auto scope = line.words.size() >= 2 ? kScopes.find(line.words[1]) : kScopes.end();
  if (scope == kScopes.end()) return Fail(line, "expected: template group|module|port [selectors]");
  Template t;
  t.line = line.number;
  t.scope = scope->second;
  for (std::size_t i = 2; i < line.words.size(); ++i) {
    if (!ReadSelector(line.words[i], t))
      return Fail(line, "selectors are kind=, model= and (for ports) type=");
  }
  if (t.scope != Scope::Port && !t.types.empty()) return Fail(line, "type= selects ports only");
  if (t.scope == Scope::Group && !(t.kinds.empty() && t.models.empty()))
    return Fail(line, "a group template takes no selectors");
  mTemplates.push_back(std::move(t));
  mOpenTemplate = true;
  return true;
}

bool Reader::ReadSelector(const Dstring& word, Template& t) {
  std::size_t eq = word.find('=');
  if (eq == Dstring::npos) return false;
  Dstring key = word.substr(0, eq);
  DstringList values = DstringList::Split(std::string_view(word).substr(eq + 1), ',');
  DstringList* target = key == "kind"    ? &t.kinds
                        : key == "model" ? &t.models
                        : key == "type"  ? &t.types
                                         : nullptr;
  if (target == nullptr || values.empty()) return false;
  target->insert(target->end(), values.begin(), values.end());
  return true;
}

bool Reader::OnGroup(const Line& line) {
  Group g;
  if (line.words.size() != 2 || !ReadNumber(line.words[1], g.number))
    return Fail(line, "expected: group <number>");
  mGroups.push_back(g);
  return true;
}

bool Reader::OnModule(const Line& line) {
  Module m;
  const DstringList& w = line.words;
  if (w.size() < 3 || w.size() > 4 || !ReadNumber(w[1], m.number) ||
      (w.size() == 4 && !(w[3].StartsWith("slot=") && ReadNumber(Dstring(w[3].substr(5)), m.slot)))) {
    return Fail(line, "expected: module <number> <model> [slot=<1..999>]");
  }
  if (mGroups.empty()) return Fail(line, "a module belongs to a group");
  m.model = line.words[2];
  if (!mModelKinds.contains(m.model))
    return Fail(line, Dstring::Format("model %s is not declared", m.model.c_str()));
  // Without slot= a module sits in the slot of its place in the rack.
  std::set<unsigned long> taken;
  for (const Group& g : mGroups) {
    for (const Module& other : g.modules) taken.insert(other.slot);
  }
  if (m.slot == 0) m.slot = taken.size() + 1;
  if (taken.contains(m.slot)) return Fail(line, Dstring::Format("slot %lu is taken", m.slot));
  mGroups.back().modules.push_back(m);
  return true;
}

bool Reader::OnPort(const Line& line) {
  Port p;
  if (line.words.size() != 3 || !ReadNumber(line.words[1], p.number))
    return Fail(line, "expected: port <number> <type>");
  if (mGroups.empty() || mGroups.back().modules.empty()) return Fail(line, "a port belongs to a module");
  p.type = line.words[2];
  mGroups.back().modules.back().ports.push_back(p);
  return true;
}

bool Reader::Substitute(const Line& line, const Placeholders& names, Line& out) {
  out.number = line.number;
  out.words.clear();
  for (Dstring word : line.words) {
    for (const auto& [name, value] : names) {
      for (std::size_t at = word.find(name); at != Dstring::npos; at = word.find(name, at + value.size())) {
        word.replace(at, name.size(), value);
      }
    }
    if (word.find('{') != Dstring::npos)
      return Fail(line, Dstring::Format("no placeholder here: %s", word.c_str()));
    out.words.push_back(word);
  }
  return true;
}

bool Reader::AddParam(const Line& raw, const Placeholders& names) {
  Line line;
  if (!Substitute(raw, names, line)) return false;
  const DstringList& w = line.words;
  SimParamType type{};
  if (w.size() < 4 || !SimParam::TypeFromName(w[2], type)) {
    return Fail(line, "expected: param <header> double|integer|enum|string|bool <value> [options]");
  }
  if (!w[1].StartsWith(":") || w[1].find_first_of("?@;\",") != Dstring::npos) {
    return Fail(line, Dstring::Format("bad header %s", w[1].c_str()));
  }
  SimParam param(w[1].ToUpper(), type);
  ParamExtras extras;
  for (std::size_t i = 4; i < w.size(); ++i) {
    if (!ReadOption(line, w[i], param, extras)) return false;
  }
  double number = 0.0;
  Dstring text;
  if (param.ParseValue(w[3], number, text) != 0)
    return Fail(line, Dstring::Format("bad value %s", w[3].c_str()));
  if (param.IsNumeric() && !param.IsWithinLimits(number)) return Fail(line, "value outside min..max");
  param.SetValue(number, text);
  if (param.GetAttr().GetUnit().empty()) SetDefaultAttr(param, extras);
  if (param.GetAttr().Check() != 0) return Fail(line, "exp outside the exponents of its unit");
  if (!mTable.Add(param))
    return Fail(line, Dstring::Format("%s is defined twice", param.GetHeader().c_str()));
  return true;
}

bool Reader::ReadOption(const Line& line, const Dstring& option, SimParam& param, ParamExtras& extras) {
  std::size_t eq = option.find('=');
  Dstring key = option.substr(0, eq);
  Dstring value = eq == Dstring::npos ? Dstring() : Dstring(option.substr(eq + 1));
  for (const ParamOption& o : kParamOptions) {
    if (key == o.key && o.takesValue == (eq != Dstring::npos) && o.set(value, param, extras)) return true;
  }
  return Fail(line, Dstring::Format("bad option %s", option.c_str()));
}

void Reader::SetDefaultAttr(SimParam& param, const ParamExtras& extras) {
  auto known = mUnits.find(extras.unit);
  SimUnitAttr attr = known != mUnits.end() ? known->second : SimUnitAttr(extras.unit, 0, 0, SimUnitAttr::kNotSet, 1.0);
  param.SetAttr(extras.exponent == SimUnitAttr::kNotSet ? attr : attr.WithCurExp(extras.exponent));
}

bool Reader::Expand(Scope scope, const Placeholders& names, const Dstring& kind, const Dstring& model,
                    const Dstring& type) {
  for (const Template& t : mTemplates) {
    if (t.scope != scope || !ListMatches(t.kinds, kind) || !ListMatches(t.models, model) ||
        !ListMatches(t.types, type)) {
      continue;
    }
    for (const Line& line : t.lines) {
      Line expanded;
      if (line.words[0] == "param" && !AddParam(line, names)) return false;
      if (line.words[0] == "couple" && !Substitute(line, names, expanded)) return false;
      if (line.words[0] == "couple") mCouples.push_back(expanded);
    }
  }
  return true;
}

bool Reader::Finish() {
  if (mOpenTemplate) return Fail(Line{mTemplates.back().line, {}}, "template without end");
  for (const Group& g : mGroups) {
    if (!ExpandGroup(g)) return false;
  }
  for (const Line& line : mCouples) {
    DstringList headers(line.words.begin() + 2, line.words.end());
    Dstring why;
    if (!mTable.AddCoupling(line.words[1], headers, why)) return Fail(line, why);
  }
  mTable.Settle();
  mTable.SetRack(std::move(mRack));
  return true;
}

bool Reader::ExpandGroup(const Group& g) {
  mRack.AddGroup(static_cast<long>(g.number));
  Placeholders names{{"{group}", Dstring::Format(":CGR%lu", g.number)},
                     {"{cgr}", Dstring::Format("%lu", g.number)}};
  if (!Expand(Scope::Group, names, "", "", "")) return false;
  for (const Module& m : g.modules) {
    if (!ExpandModule(m, names)) return false;
  }
  return true;
}

bool Reader::ExpandModule(const Module& m, Placeholders names) {
  const Dstring& kind = mModelKinds[m.model];
  Dstring module = names["{group}"] + Dstring::Format(":MOD%lu", m.number);
  names.insert({{"{module}", module},
                {"{mod}", Dstring::Format("%lu", m.number)},
                {"{model}", m.model},
                {"{kind}", kind}});
  if (!Expand(Scope::Module, names, kind, m.model, "")) return false;
  mRack.AddModule({module, m.model, kind == "generator", static_cast<long>(m.slot), {}});
  for (const Port& p : m.ports) {
    const unsigned long terminals = p.type == "PDAT" ? mModelTerminals[m.model] : 1;
    mRack.AddPort({module + Dstring::Format(":CONN%lu", p.number), p.type, static_cast<long>(terminals)});
    Placeholders portNames = names;
    portNames.insert({{"{port}", module + Dstring::Format(":CONN%lu", p.number)},
                      {"{conn}", Dstring::Format("%lu", p.number)}});
    if (!Expand(Scope::Port, portNames, kind, m.model, p.type)) return false;
  }
  return true;
}

}  // namespace

int SimConfigLoader::Load(std::string_view text, SimParamTable& table, ConditionList& list) {
  Reader reader(table);
  int number = 0;
  bool ok = true;
  for (const Dstring& line : DstringList::Split(text, '\n')) {
    if (!(ok = reader.ReadLine(++number, line))) break;
  }
  if (ok) ok = reader.Finish();
  if (!ok) list.Add(0, reader.GetError());
  return ok ? 0 : 1;
}
