#pragma once

#include <QComboBox>
#include <vector>

#include "params/CBoxItem.h"
#include "params/ui/BoundControl.h"

// A combo box bound to a parameter. Its items are value-coded in the resource ("#1e-9=1 ns",
// "$SEQ=Sequence"); the item that the instrument's value selects is shown, and a choice
// writes its value. While the instrument has no value ("CLAS", 9.91e37) the box shows
// "<No Value>" over the selection it keeps. The wheel changes it only while it has the focus.
class QenDsCBox : public QComboBox, public BoundControl {
  Q_OBJECT
  Q_PROPERTY(QString DsBaseName READ DsBaseNameProperty WRITE SetDsBaseNameProperty)
  Q_PROPERTY(QString DsCmdName READ DsCmdNameProperty WRITE SetDsCmdNameProperty)
  Q_PROPERTY(QColor BgColorFailed MEMBER mBgColorFailed)
  Q_PROPERTY(QColor FgColorFailed MEMBER mFgColorFailed)
  Q_PROPERTY(bool IsDisabled READ IsDisabled WRITE SetIsDisabled)
  Q_PROPERTY(bool IsSetupConfigFunction READ IsSetupConfigFunction WRITE SetIsSetupConfigFunction)
  Q_PROPERTY(bool IsSetupConfigParameter READ IsSetupConfigParameter WRITE SetIsSetupConfigParameter)

 public:
  static constexpr const char* kNoValueText = "<No Value>";

  explicit QenDsCBox(QWidget* parent = nullptr);

  void NfyInit() override;
  // Reads the item records from the labels again (after items were added or changed).
  void ReInitList();
  int Refresh(ConditionList& list) override;
  const CBoxItem& ItemRecord(int index) const { return mItems[static_cast<std::size_t>(index)]; }
  // The text the box shows.
  QString ShownText() const;

 protected:
  void wheelEvent(QWheelEvent* event) override;
  void paintEvent(QPaintEvent* event) override;

 private:
  void HitItem(int index);

  std::vector<CBoxItem> mItems;
  bool mNoValue = false;
};
