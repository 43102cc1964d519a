#pragma once

#include <QDialog>
#include <QDialogButtonBox>
#include <QFormLayout>

// A small modal question of labelled fields with OK and Cancel, for the values a command needs
// before it runs (a new segment's shape, a deserialisation's width).
class FormDialog : public QDialog {
 public:
  FormDialog(QWidget* parent, const QString& title) : QDialog(parent), mForm(new QFormLayout(this)) {
    setWindowTitle(title);
  }

  // The field, made a child of the dialog, under its label ("&Traces").
  template <typename Field>
  Field* Add(const QString& label, Field* field) {
    field->setParent(this);
    mForm->addRow(label, field);
    return field;
  }

  // Shows the dialog; true when the user accepts.
  bool Ask() {
    auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, this);
    mForm->addRow(buttons);
    connect(buttons, &QDialogButtonBox::accepted, this, &QDialog::accept);
    connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
    return exec() == QDialog::Accepted;
  }

 private:
  QFormLayout* mForm;
};
