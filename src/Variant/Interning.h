#pragma once

#include "Variant/Export.h"
#include "io/ISchema.h"

namespace KVR {
namespace IO {

/// Returns the one instance of the process that strictly equals `schema`, so that its address
/// identifies the schema for host and plug-in alike.
///
/// The instance lives as long as the process, also after `main`. The first of equal schemas lends
/// its `Docs` and `Detail` to all later ones, as equality does not look at them. A copy of `schema`
/// is made only when it is new. [any]
KVR_VARIANT_EXPORT const ISchema& GetUniqueSchema(const ISchema& schema);

/// Returns the one instance of the schema that has this type and nothing else: the same as
/// GetUniqueSchema gives for it. A number that is no EType gives a schema of that number. [any]
KVR_VARIANT_EXPORT const ISchema& GetUniquePodSchema(EType type);

} // namespace IO
} // namespace KVR
