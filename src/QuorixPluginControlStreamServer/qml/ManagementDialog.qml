import QtQuick 2.1
import QtQuick.Layouts 1.0
import QtQuick.Controls 2.2
import QuorixQML 1.0
import Korva.Theme 1.0

Item {
    id: root
    objectName: "managementRoot"
    focus: true

    Rectangle {
        id: backgroundRect
        objectName: "backgroundRect"
        anchors.fill: parent
        color: Theme.base
    }

    Label {
        id: heading
        objectName: "heading"
        anchors {
            left: parent.left
            right: resetButton.left
            verticalCenter: resetButton.verticalCenter
            margins: Theme.margin
        }
        text: "Known Control devices:"
        color: Theme.text
        elide: Text.ElideRight
    }

    KorvaButton {
        id: resetButton
        objectName: "resetButton"
        anchors {
            right: parent.right
            top: parent.top
            margins: Theme.margin
        }
        width: Theme.buttonWidth
        text: "Reset"
        onClicked: managementModel.forgetEverthing()
    }

    KorvaScrollView {
        id: scrollView
        objectName: "scrollView"
        anchors {
            left: parent.left
            right: parent.right
            top: resetButton.bottom
            bottom: buttonOk.top
            margins: Theme.margin
        }
        ScrollBar.horizontal.policy: ScrollBar.AlwaysOff

        ListView {
            id: list
            objectName: "list"

            // What the keyboard does in place of a row's own button, which only the mouse brings up.
            function forgetCurrentRow(event) {
                if (event.isAutoRepeat) {
                    return
                }
                managementModel.forgetItem(currentIndex)
                if (count === 0) {
                    // The focus would go with the last row. Here one more key does no harm.
                    resetButton.forceActiveFocus(Qt.TabFocusReason)
                }
            }

            spacing: Theme.margin
            model: managementModel
            delegate: controlDelegate
            activeFocusOnTab: count > 0

            Keys.onSpacePressed: forgetCurrentRow(event)
            Keys.onReturnPressed: forgetCurrentRow(event)
            Keys.onEnterPressed: forgetCurrentRow(event)
            Keys.onDeletePressed: forgetCurrentRow(event)

            add: Transition {
                NumberAnimation {
                    property: "opacity"
                    from: 0
                    to: 1.0
                    duration: 300
                    easing.type: Easing.InQuart
                }
            }
            remove: Transition {
                NumberAnimation {
                    property: "opacity"
                    from: 1.0
                    to: 0
                    duration: 300
                    easing.type: Easing.OutQuart
                }
            }
            displaced: Transition {
                NumberAnimation {
                    property: "y"
                    duration: 300
                    easing.type: Easing.InOutSine
                }
                NumberAnimation {
                    property: "opacity"
                    to: 1.0
                }
            }
        }
    }

    KorvaButton {
        id: buttonOk
        objectName: "buttonOk"
        anchors {
            right: buttonCancel.left
            bottom: parent.bottom
            margins: Theme.margin
        }
        width: Theme.buttonWidth
        text: "Ok"
        onClicked: managementDialog.OnOk()
    }

    KorvaButton {
        id: buttonCancel
        objectName: "buttonCancel"
        anchors {
            right: parent.right
            bottom: parent.bottom
            margins: Theme.margin
        }
        width: Theme.buttonWidth
        text: "Cancel"
        onClicked: managementDialog.OnClose()
    }

    Component {
        id: controlDelegate

        Rectangle {
            id: rect
            objectName: "rect"
            width: list.width
            height: label.height + 20
            color: Theme.window

            MouseArea {
                id: itemMouseArea
                objectName: "itemMouseArea"
                anchors.fill: parent
                hoverEnabled: true
            }

            Image {
                id: imageControl
                objectName: "imageControl"
                anchors {
                    left: parent.left
                    leftMargin: Theme.margin
                    verticalCenter: parent.verticalCenter
                }
                width: parent.height - 8
                height: width
                source: "qrc:/images/ControlIcon.svg"
                sourceSize: Qt.size(2 * width, 2 * width)
                fillMode: Image.PreserveAspectFit
            }

            Image {
                id: imageAllowed
                objectName: "imageAllowed"
                anchors.fill: imageControl
                visible: itemAuthorised
                source: "qrc:/images/ControlAllowed.svg"
                sourceSize: imageControl.sourceSize
                fillMode: Image.PreserveAspectFit
            }

            Image {
                id: imageBanned
                objectName: "imageBanned"
                anchors.fill: imageControl
                visible: !itemAuthorised
                source: "qrc:/images/ControlBanned.svg"
                sourceSize: imageControl.sourceSize
                fillMode: Image.PreserveAspectFit
            }

            Text {
                id: label
                objectName: "label"
                anchors {
                    left: imageControl.right
                    right: forgetButton.left
                    margins: Theme.margin
                    verticalCenter: parent.verticalCenter
                }
                // The name is a device's: no markup in it is ever rendered, marks piled upon a
                // character stay within the label, and one of a megabyte is cut, as its layout would
                // take minutes.
                text: itemName.substring(0, 500)
                textFormat: Text.PlainText
                clip: true
                color: Theme.text
                horizontalAlignment: Text.AlignLeft
                maximumLineCount: 1
                elide: Text.ElideRight
            }

            KorvaButton {
                id: forgetButton
                objectName: "forgetButton"
                anchors {
                    right: parent.right
                    rightMargin: Theme.margin
                    verticalCenter: parent.verticalCenter
                }
                // Nobody can see it while the mouse is elsewhere, so the keyboard passes it by and
                // works with the row instead.
                focusPolicy: Qt.NoFocus
                opacity: itemMouseArea.containsMouse || hovered ? 1.0 : 0.0
                text: "Forget"
                onClicked: managementModel.forgetItem(index)

                Behavior on opacity {
                    NumberAnimation { duration: 300 }
                }
            }

            // Stands where the button comes up, in the row whose device the keyboard would forget.
            Rectangle {
                id: keyboardFocus
                objectName: "keyboardFocus"
                anchors.fill: forgetButton
                visible: list.activeFocus && rect.ListView.isCurrentItem
                color: "transparent"
                radius: 3
                border { width: 2; color: Theme.text }

                Text {
                    anchors.centerIn: parent
                    text: forgetButton.text
                    color: Theme.text
                    opacity: 1.0 - forgetButton.opacity
                }
            }
        }
    }
}
