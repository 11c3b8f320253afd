#include "QmlFolder.h"

#include <QCoreApplication>
#include <QQuickWindow>
#include <QSignalSpy>

#include <vector>

namespace {

// Contexts that are shared are what makes Qt keep the scene graph of a view that changes its
// window.
const bool contextsAreShared = [] {
    QCoreApplication::setAttribute(Qt::AA_ShareOpenGLContexts);
    return true;
}();

/// A view that was drawn, so that it has a scene graph to lose, and that counts as persistent.
class VDrawnView
{
public:
    VDrawnView() : view("Rectangle {}")
    {
        EXPECT_TRUE(contextsAreShared);
        view.Widget().resize(40, 30);
        view.Widget().show();
        view.Widget().grab();
        EXPECT_TRUE(Window()->isSceneGraphInitialized());
        Window()->setPersistentSceneGraph(true);
        connection = QObject::connect(Window(), &QQuickWindow::sceneGraphInvalidated, [this] {
            persistentWhenLost.push_back(Window()->isPersistentSceneGraph());
        });
    }
    ~VDrawnView() { QObject::disconnect(connection); }

    VQuickWidget& Widget() { return view.Widget(); }
    QQuickWindow* Window() { return view.Widget().quickWindow(); }

    void Send(int type)
    {
        QEvent event{static_cast<QEvent::Type>(type)};
        QCoreApplication::sendEvent(&view.Widget(), &event);
    }

    /// For each time that the scene graph was given up, whether it counted as persistent then.
    std::vector<bool> persistentWhenLost;

private:
    VQmlView view;
    QMetaObject::Connection connection;
};

} // namespace

TEST(SceneGraph, IsGivenUpForAnotherWindow)
{
    VDrawnView view;

    view.Send(215);

    EXPECT_EQ(std::vector<bool>{false}, view.persistentWhenLost);
    EXPECT_TRUE(view.Window()->isPersistentSceneGraph());
}

TEST(SceneGraph, IsGivenUpForAnotherScreen)
{
    VDrawnView view;

    view.Send(216);

    EXPECT_EQ(std::vector<bool>{false}, view.persistentWhenLost);
    EXPECT_TRUE(view.Window()->isPersistentSceneGraph());
}

TEST(SceneGraph, IsGivenUpWhenTheViewReallyMovesToAnotherWindow)
{
    VDrawnView view;
    QWidget other;
    other.show();

    view.Widget().setParent(&other);
    view.Widget().show();

    EXPECT_FALSE(view.persistentWhenLost.empty());
    EXPECT_TRUE(view.Window()->isPersistentSceneGraph());
    view.Widget().setParent(nullptr);
}

TEST(SceneGraph, IsMadeAgainAtTheNextDrawing)
{
    VDrawnView view;
    view.Send(215);
    view.Send(216);
    ASSERT_FALSE(view.Window()->isSceneGraphInitialized());

    view.Widget().hide();
    view.Widget().show();
    view.Widget().grab();

    EXPECT_TRUE(view.Window()->isSceneGraphInitialized());
}
