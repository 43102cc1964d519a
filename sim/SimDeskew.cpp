#include "SimDeskew.h"

#include "SimPlace.h"

namespace {

constexpr std::string_view kDelay = ":PULS:DEL";

}  // namespace

Dstring SimDeskew::DelayOf(const Dstring& header) {
  const long ps = 20 + (NumberAfter(header, ":CGR") * 11 + NumberAfter(header, ":MOD") * 37 + NumberAfter(header, ":CONN") * 53) % 80;
  return Dstring::Format("%ldE-12", ps);
}

void SimDeskew::Write(std::size_t index, const Dstring& text, SimContext& context) {
  context.Params().Write(index, text);
  context.NoteInstrumentChanges();
}

std::size_t SimDeskew::Begin(SimContext& context) {
  mPorts.clear();
  for (std::size_t i : context.Params().WithPrefix(":CGR")) {
    if (context.Params().At(i).GetHeader().EndsWith(kDelay)) mPorts.push_back({i, context.Params().At(i).FormatValue()});
  }
  return mPorts.size();
}

void SimDeskew::ItemDone(std::size_t item, SimContext& context) {
  Write(mPorts[item].index, DelayOf(context.Params().At(mPorts[item].index).GetHeader()), context);
}

void SimDeskew::Aborted(std::size_t done, SimContext& context) {
  for (std::size_t i = 0; i < done; ++i) Write(mPorts[i].index, mPorts[i].before, context);
}
