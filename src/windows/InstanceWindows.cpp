#include "windows/InstanceWindows.h"

#include <QMdiArea>
#include <QMdiSubWindow>
#include <memory>

#include "sequences/InstanceInfo.h"
#include "toolkit/WaitCursor.h"
#include "windows/MainWin.h"
#include "windows/WindowFactory.h"

namespace {

// The record a window was opened for, kept beside it: a child of its frame, so it goes with it.
class Holder : public QObject {
 public:
  Holder(const InstanceInfo& info, QObject* parent) : QObject(parent), mInfo(info.Clone()) {
    setObjectName(QStringLiteral("InstanceInfo"));
  }
  const InstanceInfo& Info() const { return *mInfo; }

 private:
  std::unique_ptr<InstanceInfo> mInfo;
};

const Holder* HolderOf(const QWidget* frame) {
  return frame == nullptr
             ? nullptr
             : frame->findChild<const Holder*>(QStringLiteral("InstanceInfo"), Qt::FindDirectChildrenOnly);
}

}  // namespace

QWidget* InstanceWindows::Find(const MainWin& main, const InstanceInfo& info) {
  for (QMdiSubWindow* sub : main.Area()->subWindowList()) {
    const Holder* holder = HolderOf(sub);
    if (holder != nullptr && holder->Info().isEqual(&info)) return sub->widget();
  }
  return nullptr;
}

const InstanceInfo* InstanceWindows::GetInstanceInfo(const QWidget* window) {
  const Holder* holder = window == nullptr ? nullptr : HolderOf(window->parentWidget());
  return holder == nullptr ? nullptr : &holder->Info();
}

QWidget* InstanceWindows::Open(MainWin& main, const Dstring& resource, const InstanceInfo& info,
                               const QString& title, ConditionList& list) {
  if (QWidget* open = Find(main, info)) {
    auto* sub = qobject_cast<QMdiSubWindow*>(open->parentWidget());
    main.Area()->setActiveSubWindow(sub);
    sub->raise();
    open->setFocus();
    return open;
  }
  QWidget* window = nullptr;
  {
    WaitCursor wait;
    window = WindowFactory::Make(resource, nullptr, list);
  }
  if (window == nullptr) return nullptr;
  QMdiSubWindow* sub = main.Adopt(window, QString::fromStdString(resource), title);
  new Holder(info, sub);
  return window;
}
