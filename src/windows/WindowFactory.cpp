#include "windows/WindowFactory.h"

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
#include "windows/seqedit/SeqeditSeqEdWin.h"
#include "windows/smseqedit/SmseqeditWin.h"
#include "windows/wavewin/WavewinWaveWin.h"

namespace {

template <class T>
WindowFactory::Make Maker() {
  return [](QWidget* parent, ConditionList& list) -> QWidget* {
    auto* window = new T(parent);
    if (window->Load(list) == 0) return window;
    delete window;
    return nullptr;
  };
}

}  // namespace

const std::vector<WindowFactory::Entry>& WindowFactory::Entries() {
  // Editors first, then the tools used all day: the first nine have Ctrl+1 … Ctrl+9.
  static const std::vector<Entry> kEntries = {
      {"paramedit.ParamEd", "Parameter Editor", Maker<ParameditParamEdWin>(), true},
      {"dataedit.SegmentEditWin", "Segment Editor", Maker<DataeditSegmentEditWin>(), true},
      {"smseqedit.Win", "Simple Sequence", Maker<SmseqeditWin>(), true},
      {"LoopGridEdit.Win", "Loop Grid", Maker<LoopGridEditWin>(), true},
      {"seqedit.SeqEdWin", "Sequence", Maker<SeqeditSeqEdWin>(), true},
      {"bconnect.ConnectWin", "System Scheme", Maker<BconnectConnectWin>()},
      {"dtecmd.CmdWin", "Command Window", Maker<DtecmdCmdWin>()},
      {"error.ErrorWin", "Error List", Maker<ErrorErrorWin>()},
      {"ber.BerWin", "Bit Error Rate", Maker<BerBerWin>()},
      {"errstate.ErrStateWin", "Error State", Maker<ErrstateErrStateWin>()},
      {"wavewin.WaveWin", "Waveform", Maker<WavewinWaveWin>()},
      {"measconf.MeasMode", "Measurement Mode", Maker<MeasconfMeasModeDlg>(), true},
      {"deskew.DeskewWin", "Deskew", Maker<DeskewDeskewWin>()},
      {"selftest.Result", "Self Test", Maker<SelftestResultWin>()},
  };
  return kEntries;
}

const WindowFactory::Entry* WindowFactory::Find(const Dstring& resource) {
  for (const Entry& e : Entries()) {
    if (e.resource == resource) return &e;
  }
  return nullptr;
}
