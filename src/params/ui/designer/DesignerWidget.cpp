#include "DesignerWidget.h"

DesignerWidget::DesignerWidget(QString className, QString header, QString toolTip, Factory factory)
    : mClassName(std::move(className)), mHeader(std::move(header)), mToolTip(std::move(toolTip)),
      mFactory(std::move(factory)) {}

QString DesignerWidget::domXml() const {
  QString objectName = mClassName;
  objectName[0] = objectName[0].toLower();
  return QStringLiteral("<ui language=\"c++\"><widget class=\"%1\" name=\"%2\"/></ui>").arg(mClassName, objectName);
}
