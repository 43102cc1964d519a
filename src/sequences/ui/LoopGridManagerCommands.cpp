// The loop grid's commands: each is one command of the model, reported where the user sees it.
#include "params/ui/BoundControl.h"
#include "sequences/ui/LoopGridManager.h"

int LoopGridManager::Apply(const std::function<int(ConditionList&)>& edit, ConditionList& list) {
  if (GetSequence() == nullptr) return 0;
  const int status = edit(list);
  // Refused or not, the grid shows what the instrument holds now.
  Sync();
  return status;
}

int LoopGridManager::Run(const std::function<int(ConditionList&)>& edit) {
  ConditionList list;
  const int status = Apply(edit, list);
  BoundControl::Report(list);
  return status;
}

// The editing commands a pattern-editor window asks the grid with the focus for: whole blocks.
int LoopGridManager::ModifyCopy(ConditionList& list) { return mModel.CopyBlock(list); }

int LoopGridManager::ModifyPaste(ConditionList& list) {
  return Apply([this](ConditionList& l) { return mModel.PasteBlock(l); }, list);
}

int LoopGridManager::ModifyInsert(VectorTrace, InsertMode mode, long count, ConditionList& list) {
  return Apply([&](ConditionList& l) { return mModel.InsertBlocks(mode == InsertMode::kBefore, count, l); }, list);
}

int LoopGridManager::ModifyDelete(ConditionList& list) {
  return Apply([this](ConditionList& l) { return mModel.DeleteBlock(l); }, list);
}

int LoopGridManager::InsertBlock(bool before) {
  const int status = Run([&](ConditionList& l) { return mModel.InsertBlock(before, l); });
  if (status == 0) Follow();
  return status;
}

int LoopGridManager::DeleteBlock() {
  return Run([this](ConditionList& l) { return mModel.DeleteBlock(l); });
}

int LoopGridManager::MoveBlock(long distance) {
  const int status = Run([&](ConditionList& l) { return mModel.MoveBlock(distance, l); });
  if (status == 0) Follow();
  return status;
}

int LoopGridManager::CutBlock() {
  return Run([this](ConditionList& l) { return mModel.CutBlock(l); });
}

int LoopGridManager::CopyBlock() {
  ConditionList list;
  const int status = mModel.CopyBlock(list);
  BoundControl::Report(list);
  return status;
}

int LoopGridManager::PasteBlock() {
  const int status = Run([this](ConditionList& l) { return mModel.PasteBlock(l); });
  if (status == 0) Follow();
  return status;
}

int LoopGridManager::AddLoop() {
  return Run([this](ConditionList& l) { return mModel.AddLoop(l); });
}

int LoopGridManager::RemoveLoop() {
  return Run([this](ConditionList& l) { return mModel.RemoveLoop(l); });
}

int LoopGridManager::Undo() {
  return Run([this](ConditionList& l) { return mModel.Undo(l); });
}

int LoopGridManager::Redo() {
  return Run([this](ConditionList& l) { return mModel.Redo(l); });
}

int LoopGridManager::SetCellText(unsigned long block, int field, const QString& text) {
  return Run([&](ConditionList& l) { return mModel.SetCellText(block, field, text.trimmed().toStdString(), l); });
}

int LoopGridManager::GetSegmentName(long row, long column, Dstring& name, ConditionList&) {
  name = mModel.NamedSegment(static_cast<unsigned long>(row) + 1, PortOf(static_cast<int>(column)));
  return 0;
}
