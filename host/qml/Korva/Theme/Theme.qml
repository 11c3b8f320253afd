pragma Singleton

import QtQuick 2.15

// The colours and distances of every Quick view, in a light and a dark set. The set follows the
// application's palette, so that views and widgets agree.
QtObject {
    id: theme

    readonly property bool dark: palette.window.hslLightness < 0.5

    // Distances hang on the font, which grows with the display's resolution.
    readonly property real unit: metrics.height / 16
    readonly property int margin: Math.round(10 * unit)
    readonly property int buttonWidth: Math.round(80 * unit)
    readonly property int buttonHeight: Math.round(26 * unit)
    readonly property int indicatorSize: Math.round(16 * unit)
    readonly property int radius: Math.round(3 * unit)
    readonly property int scrollBarWidth: Math.round(8 * unit)

    readonly property color base: dark ? "#26292e" : "#f4f5f7"
    readonly property color window: dark ? "#32363c" : "#ffffff"
    readonly property color text: dark ? "#eceef1" : "#1d2126"
    readonly property color border: dark ? "#6b737d" : "#8b939d"
    readonly property color button: dark ? "#3f444c" : "#e4e7eb"
    readonly property color buttonHovered: dark ? "#4b515a" : "#d8dce2"
    readonly property color buttonPressed: dark ? "#2f6fb2" : "#b9d4f0"
    readonly property color accent: dark ? "#5aa9f5" : "#1c6cbc"
    readonly property color accentText: dark ? "#14171a" : "#ffffff"
    readonly property color scrollBar: dark ? "#7b838d" : "#9aa2ac"

    readonly property font font: metrics.font

    readonly property SystemPalette palette: SystemPalette {}
    readonly property FontMetrics metrics: FontMetrics {
        font: Qt.application.font
    }
}
