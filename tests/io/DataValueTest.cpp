#include "io/DataValue.h"

#include "Variant/Interning.h"

#include <gtest/gtest.h>

using namespace KVR::IO;

namespace {

VDataValue MakeValue(const ISchema* schema, std::vector<unsigned char> bytes)
{
    VDataValue value;
    value.Schema = schema;
    value.Bytes = std::move(bytes);
    return value;
}

} // namespace

TEST(DataValue, StartsEmptyWithoutASchema)
{
    const VDataValue value;

    EXPECT_TRUE(value.Empty());
    EXPECT_EQ(nullptr, value.Schema);
}

TEST(DataValue, NoSchemaStandsForVoid)
{
    EXPECT_EQ(&GetUniquePodSchema(EType::Void), VDataValue().EffectiveSchema());
    EXPECT_EQ(&GetUniquePodSchema(EType::Bool),
              MakeValue(&GetUniquePodSchema(EType::Bool), {}).EffectiveSchema());
}

TEST(DataValue, AnyByteIsAValue)
{
    EXPECT_FALSE(MakeValue(nullptr, {0}).Empty());
    EXPECT_TRUE(MakeValue(&GetUniquePodSchema(EType::Bool), {}).Empty());
}

TEST(DataValue, EqualsBySchemaPointerAndBytes)
{
    const ISchema* number = &GetUniquePodSchema(EType::Int32);
    const ISchema* real = &GetUniquePodSchema(EType::Float32);

    EXPECT_TRUE(MakeValue(number, {1, 2}) == MakeValue(number, {1, 2}));
    EXPECT_FALSE(MakeValue(number, {1, 2}) != MakeValue(number, {1, 2}));
    EXPECT_TRUE(MakeValue(number, {1, 2}) != MakeValue(real, {1, 2}));
    EXPECT_TRUE(MakeValue(number, {1, 2}) != MakeValue(number, {1, 3}));
    EXPECT_TRUE(MakeValue(number, {1, 2}) != MakeValue(number, {1, 2, 0}));
}

TEST(DataValue, NoSchemaEqualsVoidAndNothingElse)
{
    EXPECT_TRUE(MakeValue(nullptr, {}) == MakeValue(&GetUniquePodSchema(EType::Void), {}));
    EXPECT_FALSE(MakeValue(nullptr, {}) == MakeValue(&GetUniquePodSchema(EType::Bool), {}));
}

TEST(DataValue, EqualSchemasThatAreNotInternedDiffer)
{
    // The pointer is what identifies a schema: a record of one's own is another schema.
    const ISchema own = GetUniquePodSchema(EType::Int32);

    EXPECT_FALSE(MakeValue(&own, {1}) == MakeValue(&GetUniquePodSchema(EType::Int32), {1}));
}
