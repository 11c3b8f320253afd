import QtQuick 2.15
import QtQuick.Templates 2.15 as T

import Korva.Theme 1.0

// A push button. With the keyboard's focus it is pressed by the space bar and by the two keys that
// enter.
T.Button {
    id: button

    implicitWidth: Math.max(Theme.buttonWidth, contentItem.implicitWidth + 2 * padding)
    implicitHeight: Theme.buttonHeight
    padding: Theme.margin / 2
    font: Theme.font
    hoverEnabled: true

    Keys.onReturnPressed: button.clicked()
    Keys.onEnterPressed: button.clicked()

    contentItem: Text {
        text: button.text
        textFormat: Text.PlainText
        font: button.font
        color: button.enabled ? Theme.text : Theme.border
        elide: Text.ElideRight
        horizontalAlignment: Text.AlignHCenter
        verticalAlignment: Text.AlignVCenter
    }

    background: Rectangle {
        radius: Theme.radius
        color: button.down ? Theme.buttonPressed
                           : button.hovered ? Theme.buttonHovered : Theme.button
        border.width: button.visualFocus ? 2 : 1
        border.color: button.visualFocus ? Theme.accent : Theme.border
    }
}
