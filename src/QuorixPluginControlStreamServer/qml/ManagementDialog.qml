import QtQuick 2.0
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
            spacing: Theme.margin
            model: managementModel
            delegate: controlDelegate

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
                text: itemName
                // The name is a device's: no markup in it is ever rendered.
                textFormat: Text.PlainText
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
                // Nobody can see it while the mouse is elsewhere, so the keyboard passes it by.
                focusPolicy: Qt.NoFocus
                opacity: itemMouseArea.containsMouse || hovered ? 1.0 : 0.0
                text: "Forget"
                onClicked: managementModel.forgetItem(index)

                Behavior on opacity {
                    NumberAnimation { duration: 300 }
                }
            }
        }
    }
}
