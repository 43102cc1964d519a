#include "toolkit/qt/ResourceLibrary.h"

#include <QBuffer>
#include <QDir>
#include <QFile>
#include <QUiLoader>
#include <QVBoxLayout>
#include <QWidget>
#include <QXmlStreamReader>

#include "support/ConditionListLoader.h"
#include "toolkit/qt/ResourceWidget.h"
#include "toolkit/qt/WidgetClassTable.h"

// The library's forms are in a static library: their registration must be pulled in by name.
static void InitResourceFile() { Q_INIT_RESOURCE(uiapp); }

namespace {

// Builds the library's own classes by their registered names, everything else as Qt does.
class ResourceLoader : public QUiLoader {
 public:
  QWidget* createWidget(const QString& className, QWidget* parent, const QString& name) override {
    QWidget* widget = WidgetClassTable::Create(className.toStdString(), parent);
    if (widget == nullptr) return QUiLoader::createWidget(className, parent, name);
    widget->setObjectName(name);
    return widget;
  }
};

QString FormPath(const Dstring& resource) { return QStringLiteral(":/uiapp/%1.ui").arg(QString::fromStdString(resource)); }

// A form is well-formed XML whose root element is <ui>.
bool IsForm(const QByteArray& bytes, QString& error) {
  QXmlStreamReader xml(bytes);
  if (!xml.readNextStartElement() || xml.name() != QLatin1String("ui")) {
    error = xml.hasError() ? xml.errorString() : QStringLiteral("the root element is not <ui>");
    return false;
  }
  while (!xml.atEnd()) xml.readNext();
  if (xml.hasError()) error = QStringLiteral("line %1: %2").arg(xml.lineNumber()).arg(xml.errorString());
  return !xml.hasError();
}

}  // namespace

int ResourceLibrary::Check(const Dstring& name, ConditionList& list) {
  InitResourceFile();
  const QDir dir(QStringLiteral(":/%1").arg(QString::fromStdString(name)));
  const QStringList forms = dir.entryList({QStringLiteral("*.ui")}, QDir::Files);
  if (forms.isEmpty()) {
    ConditionListLoader::ConditionToken(list, "GUI_RESOURCE_LIBRARY_MISSING", {name}, 1);
    return 1;
  }
  int status = 0;
  for (const QString& form : forms) {
    QFile file(dir.filePath(form));
    QString error;
    if (!file.open(QIODevice::ReadOnly) || !IsForm(file.readAll(), error)) {
      ConditionListLoader::ConditionToken(list, "GUI_RESOURCE_BROKEN",
                                          {form.chopped(3).toStdString(), error.toStdString()}, 1);
      status = 1;
    }
  }
  return status;
}

QWidget* ResourceLibrary::Load(const Dstring& resource, QWidget* parent, ConditionList& list) {
  InitResourceFile();
  QFile file(FormPath(resource));
  if (!file.open(QIODevice::ReadOnly)) {
    ConditionListLoader::ConditionToken(list, "GUI_RESOURCE_MISSING", {resource}, 1);
    return nullptr;
  }
  const QByteArray bytes = file.readAll();
  QString error;
  if (!IsForm(bytes, error)) {
    ConditionListLoader::ConditionToken(list, "GUI_RESOURCE_BROKEN", {resource, error.toStdString()}, 1);
    return nullptr;
  }
  QBuffer buffer;
  buffer.setData(bytes);
  buffer.open(QIODevice::ReadOnly);
  ResourceLoader loader;
  QWidget* widget = loader.load(&buffer, parent);
  if (widget == nullptr) {
    ConditionListLoader::ConditionToken(list, "GUI_RESOURCE_BROKEN",
                                        {resource, loader.errorString().toStdString()}, 1);
    return nullptr;
  }
  InitWidgets(widget);
  return widget;
}

int ResourceLibrary::LoadInto(const Dstring& resource, QWidget* target, ConditionList& list) {
  QWidget* form = Load(resource, target, list);
  if (form == nullptr) return 1;
  auto* layout = new QVBoxLayout(target);
  layout->setContentsMargins(0, 0, 0, 0);
  layout->addWidget(form);
  if (!form->windowTitle().isEmpty()) target->setWindowTitle(form->windowTitle());
  target->resize(form->size());
  return 0;
}

void ResourceLibrary::InitWidgets(QWidget* root) {
  if (auto* self = dynamic_cast<ResourceWidget*>(root)) self->NfyInit();
  for (QWidget* child : root->findChildren<QWidget*>()) {
    if (auto* widget = dynamic_cast<ResourceWidget*>(child)) widget->NfyInit();
  }
}
