#pragma once

class QDialog;
class QString;

namespace QuorixHost {

/// Returns the dialog in which the plug-in asks the operator about a device, null where none is
/// open. It is known by its properties, `clientName` and `remember`: its class is the plug-in's.
/// [gui]
QDialog* FindQuestion();

/// Returns whether a dialog is such a question. [gui]
bool IsQuestion(const QDialog& dialog);

/// Presses an item of a dialog's Quick view with the mouse, as the operator would.
///
/// @param name  the item's object name
/// @return false where the dialog shows no such item [gui]
bool PressItem(QDialog& dialog, const QString& name);

/// Ends every dialog that waits for the operator, with the code 0. [gui]
void EndOpenDialogs();

} // namespace QuorixHost
