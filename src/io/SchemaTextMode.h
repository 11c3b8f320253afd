#pragma once

namespace KVR {
namespace IO {

/// The style of schema text and of value text. A type of its own, since a bare 3 would choose the
/// form that takes a bool.
///
/// |   | schema text                     | value text                                             |
/// |---|---------------------------------|--------------------------------------------------------|
/// | 0 | by position                     | tuples by position                                     |
/// | 1 | all members by name             | tuples by member name                                  |
/// | 2 | by name, without default ones   | as 1, an array or list only as its number of elements  |
/// | 3 | by position, lists as counts    | a bare row: no outer brackets, no quotes               |
/// | 4 | by position                     | a quoted row: no outer brackets, words in quotes       |
enum SchemaTextMode : int {
    SchemaTextModePositional = 0,
    SchemaTextModeNamed = 1,
    SchemaTextModeBrief = 2,
    SchemaTextModeRow = 3,
    SchemaTextModeQuotedRow = 4,
};

} // namespace IO
} // namespace KVR
