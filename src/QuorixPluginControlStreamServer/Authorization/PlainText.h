#pragma once

#include <string>

/// Returns the text that a reader of rich text would see, as UTF-8.
///
/// The text comes from a device that nobody knows. Whatever it refers to, such as pictures and
/// style sheets, is never loaded, and of a text with markup only as much is read as takes no time
/// that a person would notice. Needs an application object of Qt; one without windows will do.
/// Threads: [any].
std::string RichTextToPlainText(const std::string& richText);
