import QtQuick 2.15
import QtQuick.Templates 2.15 as T

import Korva.Theme 1.0

// A check box with its text at the right, which wraps where the box is made narrower than it.
T.CheckBox {
    id: checkBox

    implicitWidth: indicator.width + spacing + contentItem.implicitWidth + 2 * padding
    implicitHeight: Math.max(indicator.height, contentItem.implicitHeight) + 2 * padding
    padding: Math.round(Theme.margin / 4)
    spacing: Math.round(Theme.margin * 0.7)
    font: Theme.font
    hoverEnabled: true

    indicator: Rectangle {
        x: checkBox.padding
        y: Math.round((checkBox.height - height) / 2)
        width: Theme.indicatorSize
        height: Theme.indicatorSize
        radius: Theme.radius
        color: checkBox.checked ? Theme.accent : Theme.window
        border.width: checkBox.visualFocus ? 2 : 1
        border.color: checkBox.visualFocus || checkBox.hovered ? Theme.accent : Theme.border

        // The tick, of two bars.
        Item {
            visible: checkBox.checked
            anchors.centerIn: parent
            anchors.verticalCenterOffset: -Math.round(parent.height * 0.05)
            width: parent.width * 0.32
            height: parent.height * 0.62
            rotation: 45

            Rectangle {
                anchors { right: parent.right; top: parent.top; bottom: parent.bottom }
                width: Math.max(2, Math.round(Theme.indicatorSize / 8))
                color: Theme.accentText
            }
            Rectangle {
                anchors { left: parent.left; right: parent.right; bottom: parent.bottom }
                height: Math.max(2, Math.round(Theme.indicatorSize / 8))
                color: Theme.accentText
            }
        }
    }

    contentItem: Text {
        leftPadding: checkBox.indicator.width + checkBox.spacing
        text: checkBox.text
        textFormat: Text.PlainText
        font: checkBox.font
        color: checkBox.enabled ? Theme.text : Theme.border
        wrapMode: Text.Wrap
        verticalAlignment: Text.AlignVCenter
    }
}
