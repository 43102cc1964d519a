#pragma once

#include <QObject>
#include <QtUiPlugin/QDesignerCustomWidgetCollectionInterface>

// The library's widgets for the form designer. Loading it puts the controls in design mode:
// inside the designer they bind to nothing, ask nothing and write nothing.
class QenDesignerPlugin : public QObject, public QDesignerCustomWidgetCollectionInterface {
  Q_OBJECT
  Q_PLUGIN_METADATA(IID "org.qt-project.Qt.QDesignerCustomWidgetCollectionInterface")
  Q_INTERFACES(QDesignerCustomWidgetCollectionInterface)

 public:
  explicit QenDesignerPlugin(QObject* parent = nullptr);
  ~QenDesignerPlugin() override;

  QList<QDesignerCustomWidgetInterface*> customWidgets() const override { return mWidgets; }

 private:
  QList<QDesignerCustomWidgetInterface*> mWidgets;
};
