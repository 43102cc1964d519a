#include "windows/WindowFactory.h"

#include <functional>
#include <map>

#include "core/uiapp.h"
#include "windows/bconnect/BconnectConnectWin.h"
#include "windows/ber/BerBerWin.h"
#include "windows/dataedit/DataeditSegmentEditWin.h"
#include "windows/deskew/DeskewDeskewWin.h"
#include "windows/dtecmd/DtecmdCmdWin.h"
#include "windows/error/ErrorErrorWin.h"
#include "windows/errstate/ErrstateErrStateWin.h"
#include "windows/loopgridedit/LoopGridEditWin.h"
#include "windows/measconf/MeasconfMeasModeDlg.h"
#include "windows/paramedit/ParameditParamEdWin.h"
#include "windows/selftest/SelftestResultWin.h"
#include "windows/seqedit/SeqeditEventWin.h"
#include "windows/seqedit/SeqeditSeqEdWin.h"
#include "windows/smseqedit/SmseqeditWin.h"
#include "windows/wavewin/WavewinWaveWin.h"

namespace {

using Maker = std::function<QWidget*(QWidget* parent, ConditionList& list)>;

template <class T>
Maker Of() {
  return [](QWidget* parent, ConditionList& list) -> QWidget* {
    auto* window = new T(parent);
    if (window->Load(list) == 0) return window;
    delete window;
    return nullptr;
  };
}

// The class of each resource; the order and everything else is the table's.
const std::map<Dstring, Maker>& Makers() {
  static const std::map<Dstring, Maker> makers = {
      {"paramedit.ParamEd", Of<ParameditParamEdWin>()},
      {"dataedit.SegmentEditWin", Of<DataeditSegmentEditWin>()},
      {"smseqedit.Win", Of<SmseqeditWin>()},
      {"LoopGridEdit.Win", Of<LoopGridEditWin>()},
      {"seqedit.SeqEdWin", Of<SeqeditSeqEdWin>()},
      {"bconnect.ConnectWin", Of<BconnectConnectWin>()},
      {"dtecmd.CmdWin", Of<DtecmdCmdWin>()},
      {"error.ErrorWin", Of<ErrorErrorWin>()},
      {"ber.BerWin", Of<BerBerWin>()},
      {"errstate.ErrStateWin", Of<ErrstateErrStateWin>()},
      {"wavewin.WaveWin", Of<WavewinWaveWin>()},
      {"measconf.MeasMode", Of<MeasconfMeasModeDlg>()},
      {"deskew.DeskewWin", Of<DeskewDeskewWin>()},
      {"selftest.Result", Of<SelftestResultWin>()},
      {"seqedit.EventWin", Of<SeqeditEventWin>()},
  };
  return makers;
}

}  // namespace

const WindowResource* WindowFactory::Find(const Dstring& resource) {
  for (const WindowResource& window : uiapp::WindowResources()) {
    if (window.resource == resource) return &window;
  }
  return nullptr;
}

QWidget* WindowFactory::Make(const Dstring& resource, QWidget* parent, ConditionList& list) {
  const auto maker = Makers().find(resource);
  if (Find(resource) == nullptr || maker == Makers().end()) {
    list.Add(1, "There is no window \"" + resource + "\" in this program.");
    return nullptr;
  }
  return maker->second(parent, list);
}
