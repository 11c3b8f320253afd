#pragma once

#include <cstddef>
#include <vector>

namespace KVR {
namespace IO {

struct ISchema;

/// Moves every named type of a schema, the innermost first, to the end of a dictionary, and leaves
/// a `Ref` with its name in its place, so that a type which is used often is stored once.
///
/// Deliberate: the referring schema keeps its role and its `Count`, so the entry has a `Count` of 0
/// and no role of a parameter.
///
/// @param changed  set to whether `schema` itself moved; parts that moved do not count, nor does a
///                 type that the dictionary held already
/// @return the number of entries added [any]
std::size_t ExtractNamedTypes(ISchema& schema, std::vector<ISchema>& dictionary, bool& changed);

/// Puts the types of a dictionary back in place of each `Ref` in a schema, at any depth.
///
/// @return false, with the schema partly resolved, if the dictionary lacks a name, if a type holds
///         itself, and for what no program means: types that lead to more than 256 levels or have
///         more than 2^16 parts, of which a short dictionary can ask for any number [any]
bool ResolveNamedTypes(ISchema& schema, const std::vector<ISchema>& dictionary);

} // namespace IO
} // namespace KVR
