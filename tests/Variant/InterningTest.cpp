#include "Variant/Interning.h"

#include "io/SchemaSamples.h"

#include <gtest/gtest.h>

#include <atomic>
#include <set>
#include <thread>
#include <vector>

using namespace KVR::IO;

namespace {

ISchema NumberedSchema(std::uint32_t number)
{
    return ArrayOf(Plain(EType::Int32), number);
}

/// A value that is asked for its schema after main, when objects made before it are gone.
struct VLateUser
{
    const ISchema* known = nullptr;

    ~VLateUser()
    {
        if (known != nullptr && &GetUniqueSchema(NumberedSchema(77)) != known) {
            std::abort();
        }
    }
};

VLateUser lateUser;

} // namespace

TEST(Interning, EqualSchemasGiveOneInstance)
{
    const ISchema& first = GetUniqueSchema(NumberedSchema(5));
    const ISchema& second = GetUniqueSchema(NumberedSchema(5));

    EXPECT_EQ(&first, &second);
    EXPECT_NE(&first, &GetUniqueSchema(NumberedSchema(6)));
}

TEST(Interning, InstanceEqualsItsArgumentAndIsNotIt)
{
    const ISchema schema = NamedTupleOf({{"a", Plain(EType::Int32)}});

    const ISchema& unique = GetUniqueSchema(schema);

    EXPECT_NE(&schema, &unique);
    EXPECT_EQ(EType::NamedTuple, unique.Type);
    ASSERT_EQ(1u, unique.SubSchemas.size());
    EXPECT_EQ("a", unique.SubSchemas[0].first);
    EXPECT_EQ(EType::Int32, unique.SubSchemas[0].second.Type);
}

TEST(Interning, OfAnInstanceIsThatInstance)
{
    const ISchema& unique = GetUniqueSchema(NumberedSchema(8));

    EXPECT_EQ(&unique, &GetUniqueSchema(unique));
}

TEST(Interning, FirstOfEqualSchemasLendsDocsAndDetail)
{
    ISchema first = NumberedSchema(9);
    first.Docs = {"first"};
    first.Detail = 1;
    ISchema second = NumberedSchema(9);
    second.Docs = {"second"};
    second.Detail = 2;

    GetUniqueSchema(first);
    const ISchema& unique = GetUniqueSchema(second);

    EXPECT_EQ(std::vector<std::string>{"first"}, unique.Docs);
    EXPECT_EQ(1u, unique.Detail);
}

TEST(Interning, FoldsByStrictEquality)
{
    ISchema named = Plain(EType::Int32);
    named.TypeName = "Name";

    const ISchema& unique = GetUniqueSchema(named);

    EXPECT_NE(&unique, &GetUniquePodSchema(EType::Int32));
    EXPECT_EQ("Name", unique.TypeName);
}

TEST(Interning, PlainTypesHaveOneInstanceByEitherFunction)
{
    std::set<const ISchema*> seen;
    for (unsigned number = 0; number <= 20; ++number) {
        const auto type = static_cast<EType>(number);
        const ISchema& plain = GetUniquePodSchema(type);

        EXPECT_EQ(type, plain.Type);
        EXPECT_EQ(ERole::Value, plain.Role);
        EXPECT_TRUE(plain.SubSchemas.empty());
        EXPECT_EQ(&plain, &GetUniqueSchema(Plain(type)));
        seen.insert(&plain);
    }
    EXPECT_EQ(21u, seen.size());
}

TEST(Interning, PlainTypeIsFoundForASchemaWithDocsAndDetail)
{
    ISchema schema = Plain(EType::String);
    schema.Docs = {"documented"};
    schema.Detail = 3;

    EXPECT_EQ(&GetUniquePodSchema(EType::String), &GetUniqueSchema(schema));
    EXPECT_TRUE(GetUniquePodSchema(EType::String).Docs.empty());
}

TEST(Interning, ASchemaIsPlainOnlyIfItHasItsTypeAlone)
{
    std::vector<ISchema> schemas(5, Plain(EType::Enum32));
    schemas[0].Role = ERole::Input;
    schemas[1].Count = 1;
    schemas[2].TypeName = "E";
    schemas[3].EnumValues = {{"a", 0}};
    schemas[4].SubSchemas = {{"", Plain(EType::Bool)}};

    std::set<const ISchema*> instances{&GetUniquePodSchema(EType::Enum32)};
    for (const ISchema& schema : schemas) {
        instances.insert(&GetUniqueSchema(schema));
    }

    EXPECT_EQ(1 + schemas.size(), instances.size());
}

TEST(Interning, UnknownTypeIsASchemaOfItsNumber)
{
    const auto unknown = static_cast<EType>(200);

    EXPECT_EQ(unknown, GetUniquePodSchema(unknown).Type);
    EXPECT_EQ(&GetUniquePodSchema(unknown), &GetUniqueSchema(Plain(unknown)));
    EXPECT_NE(&GetUniquePodSchema(unknown), &GetUniquePodSchema(static_cast<EType>(201)));
}

TEST(Interning, InstancesStayWhereTheyAreWhileTheTableGrows)
{
    std::vector<const ISchema*> instances;
    for (std::uint32_t i = 0; i < 5000; ++i) {
        instances.push_back(&GetUniqueSchema(NumberedSchema(10000 + i)));
    }

    for (std::uint32_t i = 0; i < 5000; ++i) {
        ASSERT_EQ(instances[i], &GetUniqueSchema(NumberedSchema(10000 + i)));
        ASSERT_EQ(10000 + i, instances[i]->Count);
    }
}

TEST(Interning, ThreadsThatMeetGetTheSameInstances)
{
    constexpr std::uint32_t schemaCount = 3000;
    constexpr std::size_t threadCount = 4;
    std::vector<std::vector<const ISchema*>> seen(threadCount);
    std::atomic<std::size_t> ready{0};
    std::vector<std::thread> threads;
    for (std::size_t t = 0; t < threadCount; ++t) {
        threads.emplace_back([&seen, &ready, t] {
            ++ready;
            while (ready < threadCount) {
                std::this_thread::yield();
            }
            for (std::uint32_t i = 0; i < schemaCount; ++i) {
                const ISchema& schema = GetUniqueSchema(NumberedSchema(50000 + i));
                seen[t].push_back(schema.Count == 50000 + i ? &schema : nullptr);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }

    for (std::size_t t = 1; t < threadCount; ++t) {
        EXPECT_EQ(seen[0], seen[t]);
    }
    EXPECT_EQ(schemaCount, std::set<const ISchema*>(seen[0].begin(), seen[0].end()).size());
}

TEST(Interning, InstancesOutliveMain)
{
    // Checked by the destructor of a static object that was made before the table.
    lateUser.known = &GetUniqueSchema(NumberedSchema(77));

    EXPECT_EQ(77u, lateUser.known->Count);
}
