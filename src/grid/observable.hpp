#pragma once
// Change notification for the control models. A view (the Qt widgets, a
// test probe) registers a ModelObserver and learns what changed; the models
// never know what kind of view listens. With nobody listening a notification
// costs one branch, so bulk work on a grid is not slowed by the mechanism.

#include <cstddef>
#include <cstdint>
#include <vector>

namespace belvane::grid {

// What a PropertyChanged notice is about.
enum class Property : std::uint8_t {
  Visible,
  Enabled,
  Geometry, // Left, Top, Width, Height
  ZOrder,
  Tag,
  ToolTipText,
  Font,
  BackColor,
  ForeColor,
  Caption,
  Picture, // a button's picture
  Text,
  Selection, // text box caret and selection
  MaxLength,
  Alignment,
  Locked,
  Value, // check box and option button state
  Items, // list view items
  SelectedItem,
  ColumnHeader, // list view header text and width
  Location,     // web browser address
  Redraw,
  TabOrder,
};

class ModelObserver {
public:
  virtual ~ModelObserver() = default;

  virtual void PropertyChanged(Property) {}
  // Grid texts or formats of the inclusive range changed.
  virtual void CellsChanged(int /*firstRow*/, int /*firstCol*/, int /*lastRow*/, int /*lastCol*/) {}
  virtual void RowsInserted(int /*firstRow*/, int /*count*/) {}
  virtual void RowsRemoved(int /*firstRow*/, int /*count*/) {}
  // Column count, column widths or alignments, or row heights changed.
  virtual void LayoutChanged() {}
  virtual void ScrollChanged(int /*topRow*/, int /*leftCol*/) {}
  virtual void CurrentCellChanged(int /*row*/, int /*col*/) {}
  virtual void FocusChanged(bool /*hasFocus*/) {}
  // The model asks to be painted now (a form's Refresh, a grid's Redraw).
  virtual void RepaintRequested() {}
  // The model is being destroyed; the observer must not touch it afterwards.
  virtual void ModelDestroyed() {}
};

class Observable {
public:
  Observable() = default;
  Observable(const Observable&) = delete;
  Observable& operator=(const Observable&) = delete;
  virtual ~Observable();

  // Observers are not owned. Adding one twice has no effect. An observer may
  // remove itself (or others) while being notified.
  void AddObserver(ModelObserver* observer);
  void RemoveObserver(ModelObserver* observer);
  bool HasObservers() const noexcept { return live_ != 0; }

protected:
  template <class F> void Notify(F&& notice) {
    if (live_ == 0) return;
    NotifyAll(notice);
  }
  void NotifyProperty(Property property) {
    if (live_ == 0) return;
    NotifyAll([property](ModelObserver& o) { o.PropertyChanged(property); });
  }

private:
  template <class F> void NotifyAll(const F& notice) {
    ++depth_;
    struct Leave {
      Observable* self;
      ~Leave() {
        if (--self->depth_ == 0) self->Compact();
      }
    } leave{this};
    for (std::size_t i = 0; i < observers_.size(); ++i)
      if (ModelObserver* o = observers_[i]) notice(*o);
  }
  void Compact();

  std::vector<ModelObserver*> observers_;
  std::size_t live_ = 0;
  int depth_ = 0;
};

} // namespace belvane::grid
