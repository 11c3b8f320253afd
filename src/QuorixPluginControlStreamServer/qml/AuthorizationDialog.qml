import QtQuick 2.0
import QtQuick.Layouts 1.0
import QtQuick.Controls 2.0
import QuorixQML 1.0
import Korva.Theme 1.0

Item {
    id: root
    objectName: "authorizationRoot"

    // Room for two lines of the question and of the check box, however large the font: it asks for
    // more than the dialog's least size only where that would cut the question short.
    implicitWidth: 24 * line.implicitHeight
    implicitHeight: 4 * line.implicitHeight + buttonDeny.height + 5 * Theme.margin

    // The keyboard is with the view but with no button: a key that was meant for another window when
    // this one came up answers nothing.
    focus: true

    Text {
        id: line
        visible: false // only measured
        text: "Control"
        font: label.font
    }

    Rectangle {
        id: backgroundRect
        objectName: "backgroundRect"
        anchors.fill: parent
        color: Theme.base
    }

    Image {
        id: image
        objectName: "image"
        anchors {
            left: parent.left
            top: parent.top
            bottom: parent.bottom
            margins: Theme.margin
        }
        width: Math.min(height, parent.width / 4)
        source: "qrc:/images/ControlLogo.svg"
        sourceSize: Qt.size(2 * width, 2 * width) // enough for a display of double resolution
        fillMode: Image.PreserveAspectFit
    }

    Label {
        id: label
        objectName: "label"
        anchors {
            left: image.right
            right: parent.right
            top: parent.top
            bottom: checkRemember.top
            margins: Theme.margin
        }
        // The name is a device's: no markup in it is ever rendered, marks piled upon a character stay
        // within the label, and one of a megabyte is cut, as its layout would take minutes.
        text: "Control on '" + authorizationDialog.clientName.substring(0, 500)
              + "' is requesting a connection."
        textFormat: Text.PlainText
        clip: true
        color: Theme.text
        horizontalAlignment: Text.AlignLeft
        wrapMode: Text.Wrap
        elide: Text.ElideRight
    }

    KorvaCheckBox {
        id: checkRemember
        objectName: "checkRemember"
        anchors {
            left: image.right
            right: parent.right
            bottom: buttonDeny.top
            margins: Theme.margin
        }
        text: "Remember this choice for future connection attempts."
        onClicked: authorizationDialog.remember = checked
        Component.onCompleted: checked = authorizationDialog.remember
    }

    KorvaButton {
        id: buttonAllow
        objectName: "buttonAllow"
        anchors {
            right: buttonDeny.left
            bottom: parent.bottom
            margins: Theme.margin
        }
        width: Theme.buttonWidth
        text: "Allow"
        onClicked: authorizationDialog.OnAllow()
    }

    KorvaButton {
        id: buttonDeny
        objectName: "buttonDeny"
        anchors {
            right: parent.right
            bottom: parent.bottom
            margins: Theme.margin
        }
        width: Theme.buttonWidth
        text: "Deny"
        onClicked: authorizationDialog.OnDeny()
    }
}
