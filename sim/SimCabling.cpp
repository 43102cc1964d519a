#include "SimCabling.h"

#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

constexpr std::string_view kStem = ":CONF:CONN";

bool IsData(const SimRack::Place& place) {
  return place.port->type == "PDAT";
}

}  // namespace

SimCabling::SimCabling(const SimRack& rack) : mRack(rack), mDrivers(DefaultWiring()) {}

SimCabling::Drivers SimCabling::DefaultWiring() const {
  Drivers drivers;
  for (const SimRack::Group& g : mRack.GetGroups()) {
    std::vector<SimRack::Place> generators, analysers;
    for (const SimRack::Module& m : g.modules) {
      for (const SimRack::Port& p : m.ports) {
        if (p.type == "PDAT") (m.generator ? generators : analysers).push_back(SimRack::Place{&g, &m, &p});
      }
    }
    for (std::size_t k = 0; k < analysers.size() && k < generators.size(); ++k) {
      if (Refusal(generators[k], analysers[k], drivers).empty())
        drivers[analysers[k].port->path] = generators[k].port->path;
    }
  }
  return drivers;
}

void SimCabling::Capture(SettingText& text) const {
  for (const SimRack::Group& g : mRack.GetGroups()) {
    for (const SimRack::Module& m : g.modules) {
      for (const SimRack::Port& p : m.ports) {
        const Dstring driver = DriverOf(p.path);
        if (!driver.empty()) text.AddConnection(driver, p.path);
      }
    }
  }
}

int SimCabling::Check(const SettingText& text, Drivers& out, Dstring& detail) const {
  Drivers drivers;
  for (const SettingText::Connection& c : text.GetConnections()) {
    SimRack::Place from, to;
    const bool found = mRack.Find(c.generator, from);
    if (!found || !mRack.Find(c.analyser, to)) {
      detail = Dstring::Format("line %d: the rack has no port %s", c.line, (found ? c.analyser : c.generator).c_str());
      return -224;
    }
    const Dstring why = Refusal(from, to, drivers);
    if (!why.empty()) {
      detail = Dstring::Format("line %d: %s", c.line, why.c_str());
      return -221;
    }
    drivers[to.port->path] = from.port->path;
  }
  out = std::move(drivers);
  return 0;
}

Dstring SimCabling::DriverOf(const Dstring& analyser) const {
  auto found = mDrivers.find(analyser);
  return found == mDrivers.end() ? Dstring() : found->second;
}

Dstring SimCabling::Refusal(const SimRack::Place& from, const SimRack::Place& to, const Drivers& drivers) const {
  const Dstring& gen = from.port->path;
  const Dstring& ana = to.port->path;
  if (!IsData(from)) return gen + " is a clock port; only data ports are connected";
  if (!IsData(to)) return ana + " is a clock port; only data ports are connected";
  if (!from.module->generator) return gen + " is an analyser port; a connection starts at a generator port";
  if (to.module->generator) return ana + " is a generator port; a connection ends at an analyser port";
  if (from.group != to.group) return "the ports are in different clock groups";
  if (from.port->terminals != to.port->terminals) {
    return Dstring::Format("%s has %ld terminals, %s has %ld", gen.c_str(), from.port->terminals, ana.c_str(),
                           to.port->terminals);
  }
  const auto driver = drivers.find(ana);
  if (driver != drivers.end()) return ana + " is driven by " + driver->second + " already";
  for (const auto& [analyser, generator] : drivers) {
    if (generator == gen) return gen + " drives " + analyser + " already";
  }
  return {};
}

bool SimCabling::ReadPorts(const SimCommand& cmd, SimContext& context, SimRack::Place& from,
                               SimRack::Place& to) const {
  DataParcel items;
  ConditionList ignored;
  if (cmd.GetArgs().empty()) {
    context.Error(-109);
    return false;
  }
  if (ParserExpression::Parse(cmd.GetArgs(), items, ignored) != 0 || items.size() != 2 ||
      items[0].GetType() != DataItemType::String || items[1].GetType() != DataItemType::String) {
    context.Error(-104);
    return false;
  }
  for (std::size_t i = 0; i < 2; ++i) {
    const Dstring path(items[i].GetText());
    if (!mRack.Find(path, i == 0 ? from : to)) {
      context.Error(-224, "the rack has no port " + path);
      return false;
    }
  }
  return true;
}

void SimCabling::Add(const SimCommand& cmd, SimContext& context) {
  SimRack::Place from, to;
  if (!ReadPorts(cmd, context, from, to)) return;
  const Dstring why = Refusal(from, to, mDrivers);
  if (!why.empty()) return context.Error(-221, why);
  mDrivers[to.port->path] = from.port->path;
  context.MarkChanged(Dstring(kStem));
}

void SimCabling::Delete(const SimCommand& cmd, SimContext& context) {
  SimRack::Place from, to;
  if (!ReadPorts(cmd, context, from, to)) return;
  if (DriverOf(to.port->path) != from.port->path) {
    return context.Error(-224, from.port->path + " does not drive " + to.port->path);
  }
  mDrivers.erase(to.port->path);
  context.MarkChanged(Dstring(kStem));
}

void SimCabling::List(SimContext& context) const {
  Dstring out;
  for (const SimRack::Group& g : mRack.GetGroups()) {
    for (const SimRack::Module& m : g.modules) {
      for (const SimRack::Port& p : m.ports) {
        const Dstring driver = DriverOf(p.path);
        if (driver.empty()) continue;
        out += Dstring::Format("%s(\"%s\",\"%s\")", out.empty() ? "" : ",", driver.c_str(), p.path.c_str());
      }
    }
  }
  context.Reply(out);
}

bool SimCabling::RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  if (rest == ":CONF:FRON") {
    if (cmd.IsQuery()) {
      context.Reply(mRack.Format());
    } else {
      context.Error(-200);
    }
    return true;
  }
  if (!rest.StartsWith(kStem)) return false;
  const Dstring what(rest.substr(kStem.size()));
  if (what.empty() && cmd.IsQuery()) {
    List(context);
  } else if (what.empty()) {
    context.Error(-200);
  } else if (cmd.IsQuery() && (what == ":ADD" || what == ":DEL")) {
    context.Error(-113);
  } else if (what == ":ADD") {
    Add(cmd, context);
  } else if (what == ":DEL") {
    Delete(cmd, context);
  } else {
    return false;
  }
  return true;
}
