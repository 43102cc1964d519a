// The loop grid over a sequence of 10,000 blocks on three loop levels. The instrument is kept in
// the process and stores the sequence text as a server does, without a socket or the server's
// own check, so what is measured is the program's share: opening the grid and paging through
// every block reads the sequence once (the "reads" counter), and one edit of a cell (write,
// read back, analyse, repaint the lines shown) is set against the model's own write, read and
// analysis of the same sequence, measured in the same iterations ("ratio").
#include <benchmark/benchmark.h>

#include <QCoreApplication>
#include <QImage>
#include <chrono>
#include <memory>

#include "BenchApp.h"
#include "SequenceText.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenInstrument.h"
#include "segments/ui/AddrDisp.h"
#include "segments/ui/NameDisp.h"
#include "sequences/CPortInfo.h"
#include "sequences/CSequence.h"
#include "sequences/SequenceService.h"
#include "sequences/ui/LoopGridManager.h"

namespace {

using Clock = std::chrono::steady_clock;

double Seconds(Clock::time_point from, Clock::time_point to) {
  return std::chrono::duration<double>(to - from).count();
}

// The sequence commands of a server with the handle "_B" and ten data ports.
class SequenceStore : public QenInstrument {
 public:
  int Connect(const Dstring&, unsigned short) override { return 0; }
  int Disconnect() override { return 0; }
  bool IsConnected() const override { return true; }
  int Call(const Dstring& cmd, Dstring& reply) override {
    reply.clear();
    if (cmd == ":_B:SGEN:GLOB:SEQ?") {
      ++reads;
      reply = text;
    } else if (cmd.StartsWith(":_B:SGEN:GLOB:SEQ ")) {
      text = Dstring(cmd.substr(18));
    } else if (cmd == "_B:SGEN:GLOB:CONF?") {
      reply = Configuration();
    } else if (cmd == ":_B:SYST:ERR?") {
      reply = "0,\"No error\"";
    } else {
      return 1;
    }
    return 0;
  }
  static Dstring Configuration() {
    Dstring conf = "\"PATT\",\"\"";
    for (int p = 1; p <= 10; ++p)
      conf += Dstring::Format(",(\":CGR1:MOD%d:CONN1\",\"PDAT\",\"OUTPUT_PORT\",\"K2268A\")", p);
    return conf;
  }

  Dstring text;
  long reads = 0;
};

// The call path on the store, the one sequence model and a grid laid out as the loop grid
// window lays it out. One per program.
class Rig {
 public:
  static Rig& Get() {
    static Rig rig;
    return rig;
  }
  SequenceStore& Store() { return *mStore; }
  CSequence& Sequence() { return *SequenceService::GetSequence(); }

  std::unique_ptr<LoopGridManager> MakeGrid() {
    auto grid = std::make_unique<LoopGridManager>();
    struct Column {
      const char* name;
      int cells;
      bool right;
    };
    for (const Column& c :
         {Column{"blocks", 5, true}, Column{"loops", 15, false}, Column{"labels", 10, false},
          Column{"lengths", 8, true}, Column{"marks", 7, false}}) {
      GridDisp* disp = c.name == std::string("blocks") ? static_cast<GridDisp*>(new AddrDisp(grid.get()))
                                                       : static_cast<GridDisp*>(new NameDisp(grid.get()));
      disp->setObjectName(QLatin1String(c.name));
      disp->SetCells(c.cells);
      disp->SetRight(c.right);
    }
    grid->SetFields({10, 22, 0, 68});
    grid->resize(1400, 900);
    return grid;
  }

 private:
  Rig() {
    BenchApp();
    auto store = std::make_unique<SequenceStore>();
    mStore = store.get();
    mStore->text = sequence_text::MakeBlocks(10000);
    QenGuiInst::SetInstrument(std::move(store));
    QenGuiInst::SetAppHandle("_B");
    CPortInfo::Init(nullptr);
    SequenceService::Init(nullptr, &CPortInfo::GetSequencePorts);
    CSequence::SetNumLoopLevels(3);
    ConditionList list;
    CPortInfo::SetConfiguration(SequenceStore::Configuration(), list);
  }
  SequenceStore* mStore = nullptr;
};

void Paint(LoopGridManager& grid, QImage& image) {
  grid.render(&image);
}

// Opens the grid on the sequence (one read) and pages through every block, painting each page.
void BM_LoopGridOpenAndScroll(benchmark::State& state) {
  Rig& rig = Rig::Get();
  QImage image(1400, 900, QImage::Format_ARGB32_Premultiplied);
  long pages = 0;
  rig.Store().reads = 0;
  for (auto _ : state) {
    ConditionList list;
    rig.Sequence().ClearLastExpression();
    if (rig.Sequence().ReadSequence(list, 0) != 0) return state.SkipWithError("the sequence was not read");
    std::unique_ptr<LoopGridManager> grid = rig.MakeGrid();
    grid->SetSequence(&rig.Sequence());
    for (long first = 0; first < grid->DispLineCount(); first += grid->VisibleLines()) {
      grid->DispScrollTo(first);
      grid->Refresh();
      Paint(*grid, image);
      ++pages;
    }
    QCoreApplication::processEvents();
    grid->SetSequence(nullptr);
  }
  const double n = static_cast<double>(state.iterations());
  state.counters["blocks"] = static_cast<double>(rig.Sequence().GetNumBlocks());
  state.counters["reads"] = static_cast<double>(rig.Store().reads) / n;
  state.counters["pages"] = static_cast<double>(pages) / n;
}

// One edit of a block's length in the middle of the sequence through the grid, the lines shown
// repainted, against the model's write, read and analysis of the same text.
void BM_LoopGridEditVsModelCycle(benchmark::State& state) {
  Rig& rig = Rig::Get();
  ConditionList list;
  if (rig.Sequence().ReadSequence(list, 0) != 0) return state.SkipWithError("the sequence was not read");
  std::unique_ptr<LoopGridManager> grid = rig.MakeGrid();
  grid->SetSequence(&rig.Sequence());
  const unsigned long block = 5000;
  grid->SetCursor(block, grid->LengthField());
  QImage image(1400, 900, QImage::Format_ARGB32_Premultiplied);
  // The model's cycle: one model written, and read into a second that, like the application's
  // model, holds the sequence read before and drops it.
  CSequence model;
  CSequence back;
  double edit = 0;
  double cycle = 0;
  bool odd = false;
  for (auto _ : state) {
    odd = !odd;
    const auto t0 = Clock::now();
    if (grid->SetCellText(block, grid->LengthField(),
                          odd ? QStringLiteral("4096") : QStringLiteral("8192")) != 0) {
      return state.SkipWithError("the edit was refused");
    }
    QCoreApplication::processEvents();
    Paint(*grid, image);
    const auto t1 = Clock::now();
    ConditionList cond;
    model.fromExpression(rig.Store().text, cond);
    const auto t2 = Clock::now();
    Dstring out;
    if (model.asExpression(out, cond) != 0 || back.fromExpression(out, cond) != 0 ||
        back.AnalyzeChanges(model.GetContent(), cond) != 0) {
      return state.SkipWithError("the model's cycle failed");
    }
    const auto t3 = Clock::now();
    edit += Seconds(t0, t1);
    cycle += Seconds(t2, t3);
  }
  grid->SetSequence(nullptr);
  const double n = static_cast<double>(state.iterations());
  state.counters["ms_edit"] = 1e3 * edit / n;
  state.counters["ms_model_cycle"] = 1e3 * cycle / n;
  state.counters["ratio"] = edit / cycle;
}

}  // namespace

BENCHMARK(BM_LoopGridOpenAndScroll)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_LoopGridEditVsModelCycle)->Unit(benchmark::kMillisecond)->MinTime(2.0);
