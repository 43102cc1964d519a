#pragma once

#include <QtUiPlugin/QDesignerCustomWidgetInterface>
#include <functional>

// One widget class of the library as the form designer offers it.
class DesignerWidget : public QDesignerCustomWidgetInterface {
 public:
  using Factory = std::function<QWidget*(QWidget*)>;

  DesignerWidget(QString className, QString header, QString toolTip, Factory factory);

  QString name() const override { return mClassName; }
  QString group() const override { return QStringLiteral("Corvane 71300 bound controls"); }
  QString toolTip() const override { return mToolTip; }
  QString whatsThis() const override { return mToolTip; }
  QString includeFile() const override { return mHeader; }
  QIcon icon() const override { return {}; }
  bool isContainer() const override { return false; }
  QWidget* createWidget(QWidget* parent) override { return mFactory(parent); }
  bool isInitialized() const override { return mInitialized; }
  void initialize(QDesignerFormEditorInterface*) override { mInitialized = true; }
  QString domXml() const override;

 private:
  QString mClassName;
  QString mHeader;
  QString mToolTip;
  Factory mFactory;
  bool mInitialized = false;
};
