import QtQuick 2.15
import QtQuick.Controls 2.15
import QtQuick.Templates 2.15 as T

import Korva.Theme 1.0

// Scrolls one Flickable. Its bars lie over the content's edge and are seen only where there is more
// than fits.
T.ScrollView {
    id: scrollView

    clip: true

    ScrollBar.vertical: ScrollBar {
        parent: scrollView
        x: scrollView.width - width
        height: scrollView.height
        padding: 0
        contentItem: Rectangle {
            implicitWidth: Theme.scrollBarWidth
            radius: width / 2
            color: Theme.scrollBar
            visible: parent.size < 1.0
        }
    }

    ScrollBar.horizontal: ScrollBar {
        parent: scrollView
        y: scrollView.height - height
        width: scrollView.width
        padding: 0
        contentItem: Rectangle {
            implicitHeight: Theme.scrollBarWidth
            radius: height / 2
            color: Theme.scrollBar
            visible: parent.size < 1.0
        }
    }
}
