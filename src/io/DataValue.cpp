#include "io/DataValue.h"

#include "Variant/Interning.h"

const KVR::IO::ISchema* VDataValue::EffectiveSchema() const
{
    return Schema != nullptr ? Schema : &KVR::IO::GetUniquePodSchema(KVR::IO::EType::Void);
}

bool operator==(const VDataValue& left, const VDataValue& right)
{
    return left.EffectiveSchema() == right.EffectiveSchema() && left.Bytes == right.Bytes;
}

bool operator!=(const VDataValue& left, const VDataValue& right)
{
    return !(left == right);
}
