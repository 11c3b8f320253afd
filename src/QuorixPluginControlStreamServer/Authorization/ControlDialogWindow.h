#pragma once

class QDialog;
class QEvent;
class VQuickWidget;

/// What the windows of both control dialogs have in common. Threads: [gui].
namespace ControlDialogWindow {

/// The flags with which each dialog is constructed: those for a title and a system menu.
constexpr int constructionFlags = 0x3000;

/// Gives the dialog its title and its manners: modal, deleted when it closes, without a close
/// button, and at least so large, in logical pixels of a display of 96 dots per inch.
void SetUp(QDialog& dialog, int minimumWidth, int minimumHeight);

/// Lets the view fill the dialog.
void Fill(QDialog& dialog, VQuickWidget& view);

/// Makes the QML and the images known that were compiled in, which the linker would drop and the
/// dialogs would not miss until they came up empty.
void InitialiseResources();

} // namespace ControlDialogWindow
