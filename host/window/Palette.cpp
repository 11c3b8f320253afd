#include "window/Palette.h"

#include <QApplication>
#include <QPalette>

namespace QuorixHost {
namespace {

QPalette LightPalette()
{
    return QPalette(QColor(0xe4, 0xe7, 0xeb), QColor(0xf4, 0xf5, 0xf7));
}

QPalette DarkPalette()
{
    QPalette palette(QColor(0x3f, 0x44, 0x4c), QColor(0x26, 0x29, 0x2e));
    palette.setColor(QPalette::Highlight, QColor(0x2f, 0x6f, 0xb2));
    palette.setColor(QPalette::HighlightedText, Qt::white);
    palette.setColor(QPalette::Base, QColor(0x3a, 0x3f, 0x47));
    palette.setColor(QPalette::AlternateBase, QColor(0x34, 0x39, 0x40));
    return palette;
}

} // namespace

bool IsDarkPalette()
{
    constexpr double middle = 0.5;
    return QApplication::palette().color(QPalette::Window).lightnessF() < middle;
}

void SetPalette(bool dark)
{
    QApplication::setPalette(dark ? DarkPalette() : LightPalette());
}

} // namespace QuorixHost
