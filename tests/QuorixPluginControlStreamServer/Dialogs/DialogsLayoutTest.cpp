#include "Dialogs/DialogsSupport.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlDialogWindow.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorizationDialog.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlManagementDialog.h"

#include <QDir>
#include <QImageReader>
#include <QPainter>

#include <algorithm>
#include <cmath>
#include <tuple>

// Each dialog is rendered with names of every kind, light and dark, and looked at for what is there
// and where it lies. With QUORIX_PICTURES naming a folder the pictures are kept there.

using TestSupport::ItemOf;
using TestSupport::ItemsOf;
using TestSupport::PlaceOf;
using TestSupport::ViewOf;

namespace {

const char* const rightToLeftName =
    "\u05e9\u05dc\u05d8 \u05d1\u05de\u05d4 \u05e8\u05d0\u05e9\u05d9";

struct VLayoutCase
{
    const char* name;
    bool dark;
    std::string deviceName;
};

const std::string longName = [] {
    std::string name;
    for (int i = 1; i <= 60; ++i) {
        name += "Stage control number " + std::to_string(i) + " ";
    }
    return name;
}();

const std::string piledName = [] {
    std::string name = "a";
    for (int i = 0; i < 400; ++i) {
        name += "\u0301"; // an accent
    }
    return name;
}();

// clang-format off
const VLayoutCase layoutCases[] = {
    {"light",              false, "Tablet of the second unit"},
    {"dark",               true,  "Tablet of the second unit"},
    {"light-long",         false, longName},
    {"dark-long",          true,  longName},
    {"light-unbroken",     false, std::string(300, 'W')},
    {"light-right-to-left", false, rightToLeftName},
    {"dark-right-to-left", true,  rightToLeftName},
    {"light-no-name",      false, ""},
    {"light-piled-marks",  false, piledName},
    {"light-lines",        false, "one\ntwo\nthree\nfour\nfive\nsix\nseven\neight\nnine"},
};
// clang-format on

VControlDevices ManyDevices()
{
    VControlDevices devices;
    for (int i = 0; i < 40; ++i) {
        devices["id-" + std::to_string(i)] = {i % 3 != 0, "Control " + std::to_string(i)};
    }
    return devices;
}

VControlDevices SomeDevices()
{
    return {{"1", {true, "Tablet of the second unit"}},
            {"2", {false, "Unknown phone"}},
            {"3", {true, longName}},
            {"4", {true, rightToLeftName}},
            {"5", {false, ""}}};
}

void KeepPicture(const QImage& picture, const std::string& name)
{
    const QString folder = qEnvironmentVariable("QUORIX_PICTURES");
    if (!folder.isEmpty()) {
        const QString file = QString::fromStdString(name) + ".png";
        EXPECT_TRUE(picture.save(QDir(folder).filePath(file)));
    }
}

void KeepPicture(const QWidget& dialog, const std::string& name)
{
    const int scale = static_cast<int>(dialog.devicePixelRatioF());
    KeepPicture(ViewOf(dialog).grabFramebuffer(), name + "-" + std::to_string(scale));
}

/// Items that can be seen must lie inside the view and not upon each other.
void ExpectApart(const QWidget& dialog, const std::vector<QQuickItem*>& items)
{
    const QQuickItem& root = *ViewOf(dialog).rootObject();
    for (const QQuickItem* const item : items) {
        EXPECT_TRUE(item->isVisible()) << item->objectName().toStdString();
        EXPECT_GT(item->width(), 0) << item->objectName().toStdString();
        EXPECT_GT(item->height(), 0) << item->objectName().toStdString();
        EXPECT_TRUE(PlaceOf(root).contains(PlaceOf(*item))) << item->objectName().toStdString();
        for (const QQuickItem* const other : items) {
            EXPECT_TRUE(item == other || !PlaceOf(*item).intersects(PlaceOf(*other)))
                << item->objectName().toStdString() << " over "
                << other->objectName().toStdString();
        }
    }
}

std::vector<QQuickItem*> FindAll(const QWidget& dialog, const std::vector<const char*>& names)
{
    std::vector<QQuickItem*> items;
    for (const char* const name : names) {
        items.push_back(&ItemOf(dialog, name));
    }
    return items;
}

/// The text of an item must not run out of it; where it is too long it ends in an ellipsis.
void ExpectFits(const QQuickItem& text)
{
    EXPECT_LE(text.property("contentWidth").toReal(), text.width() + 0.5);
    EXPECT_LE(text.property("contentHeight").toReal(), text.height() + 0.5);
}

/// Returns how much two colours differ in lightness, from 0 to 1.
double Contrast(const QColor& left, const QColor& right)
{
    return std::abs(left.lightnessF() - right.lightnessF());
}

class DialogLayout : public TestSupport::VDialogs, public testing::WithParamInterface<VLayoutCase>
{
protected:
    DialogLayout() { QApplication::setPalette(TestSupport::MakePalette(GetParam().dark)); }
};

class ManagementLayout : public TestSupport::VDialogs, public testing::WithParamInterface<bool>
{
protected:
    ManagementLayout() { QApplication::setPalette(TestSupport::MakePalette(GetParam())); }

    std::unique_ptr<VQuorixControlManagementDialog> Open(const VControlDevices& devices,
                                                         const std::string& picture)
    {
        authorization->SetDevices(devices);
        auto dialog = std::make_unique<VQuorixControlManagementDialog>(context, authorization);
        dialog->setAttribute(Qt::WA_DeleteOnClose, false);
        TestSupport::Show(*dialog);
        KeepPicture(*dialog, "management-" + picture + (GetParam() ? "-dark" : "-light"));
        return dialog;
    }
};

} // namespace

INSTANTIATE_TEST_SUITE_P(Names, DialogLayout, testing::ValuesIn(layoutCases),
                         [](const auto& named) {
                             std::string name = named.param.name;
                             std::replace(name.begin(), name.end(), '-', '_');
                             return name;
                         });

TEST_P(DialogLayout, ShowsTheWholeQuestion)
{
    VQuorixControlAuthorizationDialog dialog(context, QString::fromStdString(GetParam().deviceName),
                                             true);
    dialog.setAttribute(Qt::WA_DeleteOnClose, false);
    TestSupport::Show(dialog);
    KeepPicture(dialog, std::string("authorization-") + GetParam().name);

    ExpectApart(dialog,
                FindAll(dialog, {"image", "label", "checkRemember", "buttonAllow", "buttonDeny"}));
    ExpectFits(ItemOf(dialog, "label"));
    const QQuickItem& background = ItemOf(dialog, "backgroundRect");
    EXPECT_EQ(QRectF(QPointF(), ViewOf(dialog).size()), PlaceOf(background));
    EXPECT_GT(Contrast(background.property("color").value<QColor>(),
                       ItemOf(dialog, "label").property("color").value<QColor>()),
              0.5);
    EXPECT_EQ(GetParam().dark, background.property("color").value<QColor>().lightnessF() < 0.5);
}

TEST_P(DialogLayout, PutsTheDenyingButtonInTheCorner)
{
    VQuorixControlAuthorizationDialog dialog(context, "Tablet", true);
    dialog.setAttribute(Qt::WA_DeleteOnClose, false);
    dialog.resize(700, 400);
    TestSupport::Show(dialog);

    const QRectF view = PlaceOf(ItemOf(dialog, "backgroundRect"));
    const QRectF allow = PlaceOf(ItemOf(dialog, "buttonAllow"));
    const QRectF deny = PlaceOf(ItemOf(dialog, "buttonDeny"));
    const qreal margin = view.right() - deny.right();

    EXPECT_GT(margin, 0);
    EXPECT_EQ(margin, view.bottom() - deny.bottom());
    EXPECT_EQ(margin, deny.left() - allow.right());
    EXPECT_EQ(allow.width(), deny.width());
    EXPECT_EQ(margin, PlaceOf(ItemOf(dialog, "image")).left());
    EXPECT_EQ(1, ItemOf(dialog, "image").property("fillMode").toInt()); // keeps its proportions
    EXPECT_EQ(QUrl("qrc:/images/ControlLogo.svg"), ItemOf(dialog, "image").property("source"));
}

INSTANTIATE_TEST_SUITE_P(Sets, ManagementLayout, testing::Bool(),
                         [](const auto& named) { return named.param ? "Dark" : "Light"; });

TEST_P(ManagementLayout, ShowsAnEmptyList)
{
    const auto dialog = Open({}, "empty");

    ExpectApart(*dialog, FindAll(*dialog, {"heading", "resetButton", "scrollView", "buttonOk",
                                           "buttonCancel"}));
    EXPECT_TRUE(ItemsOf(ItemOf(*dialog, "list"), "rect").empty());
}

TEST_P(ManagementLayout, ShowsARowForEachDevice)
{
    const auto dialog = Open(SomeDevices(), "some");

    const auto rows = ItemsOf(ItemOf(*dialog, "list"), "rect");
    ASSERT_EQ(5U, rows.size());
    ExpectApart(*dialog, rows);
    for (QQuickItem* const row : rows) {
        QQuickItem& label = ItemOf(*row, "label");
        ExpectApart(*dialog,
                    {&ItemOf(*row, "imageControl"), &label, &ItemOf(*row, "forgetButton")});
        ExpectFits(label);
        EXPECT_EQ(label.height() + 20, row->height());
        EXPECT_EQ(ItemOf(*dialog, "list").width(), row->width());
        EXPECT_NE(ItemOf(*row, "imageAllowed").isVisible(),
                  ItemOf(*row, "imageBanned").isVisible());
        EXPECT_EQ(PlaceOf(ItemOf(*row, "imageControl")), PlaceOf(ItemOf(*row, "imageAllowed")));
        EXPECT_EQ(PlaceOf(ItemOf(*row, "imageControl")), PlaceOf(ItemOf(*row, "imageBanned")));
    }
}

TEST_P(ManagementLayout, MarksTheRowOfTheKeyboardWhereItsButtonComesUp)
{
    const auto dialog = Open(SomeDevices(), "some");
    ItemOf(*dialog, "list").forceActiveFocus();
    KeepPicture(*dialog, std::string("management-keyboard") + (GetParam() ? "-dark" : "-light"));

    QQuickItem& first = *ItemsOf(ItemOf(*dialog, "list"), "rect").front();

    EXPECT_TRUE(ItemOf(first, "keyboardFocus").isVisible());
    EXPECT_EQ(PlaceOf(ItemOf(first, "forgetButton")), PlaceOf(ItemOf(first, "keyboardFocus")));
}

TEST_P(ManagementLayout, ScrollsAFullListAndNeverSideways)
{
    const auto dialog = Open(ManyDevices(), "full");

    QQuickItem& list = ItemOf(*dialog, "list");
    EXPECT_GT(list.property("contentHeight").toReal(), list.height());
    EXPECT_LE(list.property("contentWidth").toReal(), list.width());
    ExpectApart(*dialog, FindAll(*dialog, {"heading", "resetButton", "scrollView", "buttonOk",
                                           "buttonCancel"}));
}

/// With the desktop's font of another size.
class DialogFonts : public TestSupport::VDialogs, public testing::WithParamInterface<int>
{
protected:
    DialogFonts()
    {
        QFont font = before;
        font.setPointSize(GetParam());
        QApplication::setFont(font);
    }
    ~DialogFonts() override { QApplication::setFont(before); }

private:
    const QFont before = QApplication::font();
};

INSTANTIATE_TEST_SUITE_P(Layout, DialogFonts, testing::Values(6, 9, 12, 14));

TEST_P(DialogFonts, CutNoOrdinaryQuestionShort)
{
    VQuorixControlAuthorizationDialog dialog(TestSupport::MakeQuickContext(),
                                             "Tablet of the second unit", true);
    dialog.setAttribute(Qt::WA_DeleteOnClose, false);
    TestSupport::Show(dialog);
    KeepPicture(dialog, "authorization-" + std::to_string(GetParam()) + "-points");

    EXPECT_FALSE(ItemOf(dialog, "label").property("truncated").toBool());
    ExpectApart(dialog,
                FindAll(dialog, {"image", "label", "checkRemember", "buttonAllow", "buttonDeny"}));
}

class DialogImages : public testing::TestWithParam<std::tuple<const char*, int, bool>>
{
};

INSTANTIATE_TEST_SUITE_P(Sizes, DialogImages,
                         testing::Combine(testing::Values("ControlLogo", "ControlIcon",
                                                          "ControlAllowed", "ControlBanned"),
                                          testing::Values(16, 64), testing::Bool()));

TEST_P(DialogImages, StandOutFromTheirBackground)
{
    const auto [name, size, dark] = GetParam();
    ControlDialogWindow::InitialiseResources();
    QImageReader reader(QString(":/images/") + name + ".svg");
    reader.setScaledSize(QSize(size, size));
    const QImage image = reader.read();
    ASSERT_EQ(QSize(size, size), image.size()) << reader.errorString().toStdString();

    const QColor background = dark ? QColor(0x32, 0x36, 0x3c) : QColor(0xff, 0xff, 0xff);
    QImage shown(image.size(), QImage::Format_RGB32);
    shown.fill(background);
    QPainter(&shown).drawImage(0, 0, image);
    KeepPicture(shown,
                std::string(name) + "-" + std::to_string(size) + (dark ? "-dark" : "-light"));

    int standingOut = 0;
    for (int y = 0; y < size; ++y) {
        for (int x = 0; x < size; ++x) {
            standingOut += Contrast(shown.pixelColor(x, y), background) > 0.15 ? 1 : 0;
        }
    }
    EXPECT_GT(standingOut, size * size / 10);
}
