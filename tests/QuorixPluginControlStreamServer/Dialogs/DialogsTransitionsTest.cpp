#include "Dialogs/DialogsSupport.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlManagementDialog.h"

#include <QEasingCurve>
#include <QQmlContext>
#include <QQmlEngine>
#include <QQmlExpression>

#include <string>
#include <vector>

// How the rows of the list come, go and make room.

using TestSupport::ItemOf;
using TestSupport::PlaceOf;

namespace {

struct VAnimation
{
    std::string property;
    double from;
    double to;
    int duration;
    int easing; ///< a QEasingCurve::Type
};

bool operator==(const VAnimation& left, const VAnimation& right)
{
    return left.property == right.property && left.from == right.from && left.to == right.to &&
           left.duration == right.duration && left.easing == right.easing;
}

std::ostream& operator<<(std::ostream& out, const VAnimation& animation)
{
    return out << animation.property << ' ' << animation.from << " to " << animation.to << ", "
               << animation.duration << " ms, " << animation.easing;
}

class ManagementTransitions : public TestSupport::VDialogs
{
protected:
    /// Returns what QML finds at a path below the list.
    QVariant Find(const std::string& path) const
    {
        QQuickItem& list = ItemOf(dialog, "list");
        return QQmlExpression(qmlContext(&list), &list, QString::fromStdString(path)).evaluate();
    }

    /// Returns the animations of one of the list's transitions.
    std::vector<VAnimation> Of(const std::string& transition) const
    {
        qmlExecuteDeferred(Find(transition).value<QObject*>()); // else it waits for its first run
        std::vector<VAnimation> found;
        const int count = Find(transition + ".animations.length").toInt();
        for (int i = 0; i < count; ++i) {
            const std::string path = transition + ".animations[" + std::to_string(i) + "].";
            found.push_back({Find(path + "property").toString().toStdString(),
                             Find(path + "from").toDouble(), Find(path + "to").toDouble(),
                             Find(path + "duration").toInt(), Find(path + "easing.type").toInt()});
        }
        return found;
    }

    const VQuorixControlManagementDialog dialog{context, authorization};
};

} // namespace

TEST_F(ManagementTransitions, ARowThatComesFadesIn)
{
    const std::vector<VAnimation> expected = {{"opacity", 0.0, 1.0, 300, QEasingCurve::InQuart}};
    EXPECT_EQ(expected, Of("add"));
}

TEST_F(ManagementTransitions, ARowThatGoesFadesOut)
{
    const std::vector<VAnimation> expected = {{"opacity", 1.0, 0.0, 300, QEasingCurve::OutQuart}};
    EXPECT_EQ(expected, Of("remove"));
}

TEST_F(ManagementTransitions, RowsMoveUpAndAreWholeAgain)
{
    const std::vector<VAnimation> animations = Of("displaced");

    ASSERT_EQ(2U, animations.size());
    EXPECT_EQ("y", animations[0].property);
    EXPECT_EQ(300, animations[0].duration);
    EXPECT_EQ(QEasingCurve::InOutSine, animations[0].easing);
    EXPECT_EQ("opacity", animations[1].property);
    EXPECT_EQ(1.0, animations[1].to);
}

TEST_F(ManagementTransitions, TheListHasNoHorizontalScrollBar)
{
    QQuickItem& view = ItemOf(dialog, "scrollView");

    EXPECT_EQ(true, QQmlExpression(qmlContext(&view), &view,
                                   "ScrollBar.horizontal.policy === ScrollBar.AlwaysOff")
                        .evaluate());
}

TEST_F(ManagementTransitions, AButtonComesUpWithinTheSameTime)
{
    authorization->SetDevices({{"1", {true, "Alto"}}});
    const VQuorixControlManagementDialog filled(context, authorization);
    std::vector<int> durations;
    for (QObject* const child : ItemOf(filled, "forgetButton").findChildren<QObject*>()) {
        if (child->inherits("QQuickBehavior")) {
            qmlExecuteDeferred(child); // else it waits for its first run
            const auto* const animation = child->property("animation").value<QObject*>();
            durations.push_back(animation->property("duration").toInt());
        }
    }

    EXPECT_EQ(std::vector<int>{300}, durations);
}

TEST_F(ManagementTransitions, ARowHasTheThemesColourAndItsImages)
{
    authorization->SetDevices({{"1", {true, "Alto"}}});
    const VQuorixControlManagementDialog filled(context, authorization);
    QQuickItem& row = ItemOf(filled, "rect");
    const auto source = [&row](const char* image) {
        return ItemOf(row, image).property("source").toUrl().toString().toStdString();
    };

    EXPECT_EQ(
        true,
        QQmlExpression(qmlContext(&row), &row, "Qt.colorEqual(color, Theme.window)").evaluate());
    EXPECT_EQ("qrc:/images/ControlIcon.svg", source("imageControl"));
    EXPECT_EQ("qrc:/images/ControlAllowed.svg", source("imageAllowed"));
    EXPECT_EQ("qrc:/images/ControlBanned.svg", source("imageBanned"));
}

TEST_F(ManagementTransitions, RowsAreAMarginApart)
{
    VQuorixControlManagementDialog shown(context, authorization);
    shown.setAttribute(Qt::WA_DeleteOnClose, false);
    TestSupport::Show(shown);
    const QRectF view = PlaceOf(ItemOf(shown, "backgroundRect"));

    const qreal margin = view.right() - PlaceOf(ItemOf(shown, "buttonCancel")).right();

    EXPECT_GT(margin, 0);
    EXPECT_EQ(margin, ItemOf(shown, "list").property("spacing").toReal());
}
