// The list view that drops down where its form places it, and option
// buttons in a frame: clicks and keys through the forms' input paths.

#include "qt_fixture.hpp"

#include "forms/keys.hpp"
#include "qt/list_view.hpp"

#include <QGroupBox>
#include <QPushButton>
#include <QRadioButton>

using namespace belvane::qt;
using namespace belvane::qt::testing;
namespace keys = belvane::forms::keys;

namespace {

class frmTypes : public belvane::forms::Form {
public:
  belvane::forms::TextBox txtType{*this, "txtType"};
  belvane::forms::CommandButton CB1{*this, "CB1"};
  belvane::forms::ListView LV1{*this, "LV1"};
  belvane::forms::Frame fraSide{*this, "fraSide"};
  belvane::forms::ControlArray<belvane::forms::OptionButton, 2> optSide{*this, "optSide"};
  std::vector<int> clicked;

  frmTypes() : Form("frmTypes") {
    for (auto& o : optSide)
      o.Container(&fraSide);
    CB1.OnClick = [this] {
      // The list drops down under the text box, in front.
      LV1.Move(txtType.Left(), txtType.Top() + txtType.Height(), 1815, 1455);
      LV1.Visible(true);
      LV1.ZOrder(0);
      LV1.SetFocus();
    };
    LV1.OnItemClick = [this](int index) {
      clicked.push_back(index);
      txtType.Text(LV1.ItemText(index));
    };
    LV1.OnKeyDown = [this](int& keyCode, int) {
      if (keyCode == keys::kEnter) LV1.Visible(false);
    };
  }

protected:
  void Design() override {
    ScaleWidth(4800);
    ScaleHeight(3000);
    txtType.Move(120, 120, 1815, 285);
    CB1.Picture(belvane::forms::CommandButton::kPictureDropDown);
    CB1.Move(1935, 120, 285, 285);
    LV1.Visible(false);
    LV1.ColumnHeaderText("Part type");
    LV1.ColumnWidth(1700);
    for (const char* t : {"New(Space)", "Used(U)", "eXchange(X)", "Recore(C)"})
      LV1.AddItem(t);
    fraSide.Caption("Side");
    fraSide.Move(2880, 120, 1800, 1000);
    optSide(0).Caption("Left");
    optSide(0).Move(120, 240, 1200, 255);
    optSide(1).Caption("Right");
    optSide(1).Move(120, 600, 1200, 255);
  }
};

} // namespace

TEST_F(QtFormsTest, TheListDropsDownWhereTheFormPutsItAndTakesClicksAndKeys) {
  frmTypes form;
  RunModal(form, [&] {
    auto* list = dynamic_cast<ListViewView*>(Runtime().View(form.LV1));
    ASSERT_NE(list, nullptr);
    EXPECT_FALSE(list->Widget()->isVisible());
    // The drop-down button shows its picture.
    EXPECT_FALSE(qobject_cast<QPushButton*>(WidgetOf(form.CB1))->icon().isNull());
    Click(form.CB1);
    ASSERT_TRUE(list->Widget()->isVisible());
    // Right under the text box, in front of everything else.
    QWidget* text = WidgetOf(form.txtType);
    EXPECT_EQ(list->Widget()->geometry().topLeft(), text->geometry().bottomLeft() + QPoint(0, 1));
    EXPECT_EQ(form.ActiveControl(), &form.LV1);
    EXPECT_EQ(list->Table()->model()->index(2, 0).data().toString(), "eXchange(X)");

    // A click on an item selects it, as the model finds it under the pointer.
    QTableView* table = list->Table();
    QTest::mouseClick(table->viewport(), Qt::LeftButton, {},
                      table->visualRect(table->model()->index(1, 0)).center());
    EXPECT_EQ(form.clicked, std::vector<int>{2});
    EXPECT_EQ(form.txtType.Text(), "Used(U)");
    EXPECT_EQ(table->selectionModel()->currentIndex().row(), 1);

    Key(Qt::Key_Down);
    EXPECT_EQ(form.LV1.SelectedIndex(), 3);
    EXPECT_EQ(table->selectionModel()->currentIndex().row(), 2);
    Key(Qt::Key_Return);
    EXPECT_FALSE(list->Widget()->isVisible());

    // Option buttons in their frame: a click turns one on and the other off.
    auto* right = qobject_cast<QRadioButton*>(WidgetOf(form.optSide(1)));
    EXPECT_EQ(right->parentWidget(), WidgetOf(form.fraSide));
    EXPECT_EQ(qobject_cast<QGroupBox*>(WidgetOf(form.fraSide))->title(), "Side");
    Click(form.optSide(0));
    Click(form.optSide(1));
    EXPECT_TRUE(right->isChecked());
    EXPECT_FALSE(qobject_cast<QRadioButton*>(WidgetOf(form.optSide(0)))->isChecked());
    EXPECT_TRUE(form.optSide(1).Value());
    Runtime().Window(form)->close();
  });
}
