#pragma once
// The views of the simple controls, and the one place that picks a view
// for a control by its kind.

#include "qt/control_view.hpp"

class QLineEdit;

namespace belvane::forms {
class TextBox;
}

namespace belvane::qt {

// Makes the view (and its widget, under `parent`) of a control.
ControlView* MakeControlView(FormWindow& window, forms::Control& control, QWidget* parent);

// A text box: a QLineEdit that shows the model's text and selection. Keys
// go to the model; a click positions the caret as the line edit does and
// the model takes that caret.
class TextBoxView : public ControlView {
  Q_OBJECT
public:
  TextBoxView(FormWindow& window, forms::TextBox& box, QWidget* parent);
  void SyncAll() override;

protected:
  void Sync(grid::Property property) override;
  bool Mouse(QWidget* source, QMouseEvent* event) override;
  bool Other(QWidget* source, QEvent* event) override;
  void ApplyColors() override;

private:
  void SyncText();
  void SyncSelection();
  void SyncFrame();
  void TakeUserSelection();

  forms::TextBox& box_;
  QLineEdit* edit_;
  bool syncing_ = false;
};

// Character (code point) positions of the models and UTF-16 positions of
// Qt's strings.
int Utf16Index(const QString& text, int characters);
int CharacterIndex(const QString& text, int utf16);

} // namespace belvane::qt
