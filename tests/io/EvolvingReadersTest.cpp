#include "io/EvolvingReaders.h"

#include "io/InputStreamAdapter.h"
#include "io/ReaderBuildNode.h"
#include "io/SchemaComparison.h"
#include "io/SchemaSamples.h"
#include "io/SkipReaders.h"
#include "io/VectorReader.h"

#include <boost/bind/bind.hpp>
#include <gtest/gtest.h>

#include <cstring>
#include <typeinfo>

using namespace KVR;
using namespace KVR::IO;

namespace {

using ReaderPointer = std::shared_ptr<IReaderCollapsable>;

constexpr std::uint64_t allBitsSet = 0xFFFFFFFFFFFFFFFFu;

/// Remembers what a maker was told, and hands out readers that do nothing.
class VMakerLog
{
public:
    ReaderBuildNode Node(std::uint64_t offset, std::vector<ReaderBuildNode> children = {})
    {
        ReaderBuildNode node;
        node.Offset = offset;
        node.MakeReader = boost::bind(&VMakerLog::Make, this, boost::placeholders::_1);
        node.Children = std::move(children);
        return node;
    }

    std::vector<ReaderBuildContext> contexts;
    std::vector<ReaderPointer> made;
    std::size_t failAt = ~std::size_t{0}; ///< which call returns null

private:
    ReaderPointer Make(const ReaderBuildContext& context)
    {
        contexts.push_back(context);
        made.push_back(contexts.size() - 1 == failAt ? nullptr
                                                     : std::make_shared<VReaderSkipBytes>(0));
        return made.back();
    }
};

class EvolvingReaders : public testing::Test
{
protected:
    VMakerLog log;
};

/// Reads one value and returns how many bytes that took, or -1.
std::int64_t BytesRead(IReader& reader, const std::vector<unsigned char>& bytes, void* destination)
{
    Detail::VVectorReader cursor(bytes);
    IInputStreamAdapter<Detail::VVectorReader> stream(&cursor);
    return reader.Read(stream, destination) ? static_cast<std::int64_t>(cursor.GetPosition()) : -1;
}

const ISchema int8Schema = Plain(EType::Int8);
const ISchema int16Schema = Plain(EType::Int16);
const ISchema int64Schema = Plain(EType::Int64);
const ISchema stringSchema = Plain(EType::String);

} // namespace

TEST_F(EvolvingReaders, CurrentReaderTellsEachMakerItsTypeChildrenAndOffset)
{
    const ISchema current = NamedTupleOf({{"A", int8Schema}, {"B", ListOf(stringSchema)}});

    const ReaderPointer reader =
        BuildReader(current, log.Node(7, {log.Node(1), log.Node(2, {log.Node(3)})}));

    ASSERT_EQ(4u, log.contexts.size()); // parts before the whole, in the current order
    EXPECT_EQ(EType::Int8, log.contexts[0].StoredType);
    EXPECT_EQ(1u, log.contexts[0].Offset);
    EXPECT_EQ(EType::String, log.contexts[1].StoredType);
    EXPECT_EQ(3u, log.contexts[1].Offset);
    EXPECT_EQ(EType::List, log.contexts[2].StoredType);
    EXPECT_EQ((std::vector<ReaderPointer>{log.made[1]}), log.contexts[2].Children);
    EXPECT_EQ(EType::NamedTuple, log.contexts[3].StoredType);
    EXPECT_EQ(7u, log.contexts[3].Offset);
    EXPECT_EQ((std::vector<ReaderPointer>{log.made[0], log.made[2]}), log.contexts[3].Children);
    EXPECT_EQ(log.made[3], reader);
}

TEST_F(EvolvingReaders, CurrentReaderIsNullIfAPartFailed)
{
    const ISchema current = TupleOf({int8Schema, int8Schema, int8Schema});
    log.failAt = 1;

    EXPECT_EQ(nullptr, BuildReader(current, log.Node(0, {log.Node(0), log.Node(1), log.Node(2)})));
    EXPECT_EQ(2u, log.contexts.size()); // neither the third part nor the whole were tried
}

TEST_F(EvolvingReaders, CurrentReaderIsNullIfItsMakerFailed)
{
    log.failAt = 0;

    EXPECT_EQ(nullptr, BuildReader(int8Schema, log.Node(0)));
}

TEST_F(EvolvingReaders, CurrentReaderNeedsANodeForEachPart)
{
    EXPECT_EQ(nullptr, BuildReader(TupleOf({int8Schema}), log.Node(0)));
    EXPECT_EQ(nullptr, BuildReader(TupleOf({}), log.Node(0, {log.Node(1)})));
}

TEST_F(EvolvingReaders, EmptyMakerThrows)
{
    const ReaderBuildNode node;

    for (const bool evolving : {false, true}) {
        try {
            evolving ? BuildEvolvingReader(int8Schema, node, int8Schema)
                     : BuildReader(int8Schema, node);
            ADD_FAILURE() << "did not throw";
        } catch (const boost::bad_function_call& error) {
            EXPECT_STREQ("call to empty boost::function", error.what());
        }
    }
}

TEST_F(EvolvingReaders, MakerSeesTheStoredType)
{
    const ReaderPointer reader = BuildEvolvingReader(Plain(EType::Int32), log.Node(4), int16Schema);

    ASSERT_EQ(1u, log.contexts.size());
    EXPECT_EQ(EType::Int16, log.contexts[0].StoredType);
    EXPECT_EQ(4u, log.contexts[0].Offset);
    EXPECT_EQ(log.made[0], reader);
}

TEST_F(EvolvingReaders, DoNotAskWhetherTheTypeIsReadable)
{
    EXPECT_NE(nullptr, BuildEvolvingReader(int8Schema, log.Node(0), stringSchema));
    EXPECT_NE(nullptr, BuildEvolvingReader(Plain(EType::Void), log.Node(0), Plain(EType::Void)));
    EXPECT_EQ(EType::String, log.contexts[0].StoredType);
}

TEST_F(EvolvingReaders, MembersAreBuiltInStoredOrderFromTheNodesOfTheirNames)
{
    const ISchema stored = NamedTupleOf({{"B", int16Schema}, {"A", int8Schema}});
    const ISchema current =
        NamedTupleOf({{"A", int8Schema}, {"New", stringSchema}, {"B", int64Schema}});

    const ReaderPointer reader = BuildEvolvingReader(
        current, log.Node(0, {log.Node(10), log.Node(20), log.Node(30)}), stored);

    ASSERT_EQ(3u, log.contexts.size()); // the new member has no reader at all
    EXPECT_EQ(30u, log.contexts[0].Offset);
    EXPECT_EQ(EType::Int16, log.contexts[0].StoredType);
    EXPECT_EQ(10u, log.contexts[1].Offset);
    EXPECT_EQ(EType::NamedTuple, log.contexts[2].StoredType);
    EXPECT_EQ((std::vector<ReaderPointer>{log.made[0], log.made[1]}), log.contexts[2].Children);
    EXPECT_NE(nullptr, reader);
}

TEST_F(EvolvingReaders, RemovedMemberOfFixedSizeIsSkippedAndNeverFolded)
{
    const ISchema stored =
        NamedTupleOf({{"A", int8Schema}, {"Gone", int64Schema}, {"B", int8Schema}});
    const ISchema current = NamedTupleOf({{"A", int8Schema}, {"B", int8Schema}});

    BuildEvolvingReader(current, log.Node(0, {log.Node(0), log.Node(1)}), stored);

    const ReaderBuildContext& whole = log.contexts.back();
    ASSERT_EQ(3u, whole.Children.size());
    IReaderCollapsable& skip = *whole.Children[1];
    EXPECT_EQ(typeid(VReaderSkipBytesNoCollapse), typeid(skip));
    EXPECT_EQ(0u, skip.FlatSize);
    EXPECT_EQ(allBitsSet, skip.DestinationOffset);
    EXPECT_EQ(8, BytesRead(skip, Bytes("12345678rest"), nullptr));
    EXPECT_EQ(-1, BytesRead(skip, Bytes("1234567"), nullptr));
}

TEST_F(EvolvingReaders, RemovedMemberOfOtherSizesKeepsItsSkipReader)
{
    const ISchema flatTuple = TupleOf({int8Schema});
    const ISchema stored = NamedTupleOf({{"S", stringSchema},
                                         {"T", flatTuple},
                                         {"V", Plain(EType::Void)},
                                         {"A", ArrayOf(flatTuple, 3)},
                                         {"N", ArrayOf(int8Schema, 5)},
                                         {"E", EnumOf(EType::Enum16, {{"X", 1}})}});

    BuildEvolvingReader(NamedTupleOf({}), log.Node(0), stored);

    const std::vector<ReaderPointer>& children = log.contexts.at(0).Children;
    const std::type_info* const expected[] = {&typeid(VReaderSkipContiguousVector),
                                              &typeid(VReaderSkipTuple),
                                              &typeid(VReaderSkipBytes),
                                              &typeid(VReaderSkipArray),
                                              &typeid(VReaderSkipBytesNoCollapse),
                                              &typeid(VReaderSkipBytesNoCollapse)};
    ASSERT_EQ(6u, children.size());
    for (std::size_t i = 0; i < children.size(); ++i) {
        IReaderCollapsable& child = *children[i];
        EXPECT_EQ(*expected[i], typeid(child)) << i;
        EXPECT_EQ(0u, child.FlatSize) << i;
    }
    EXPECT_EQ(5, BytesRead(*children[4], Bytes("12345678"), nullptr));
    EXPECT_EQ(2, BytesRead(*children[5], Bytes("12345678"), nullptr));
}

TEST_F(EvolvingReaders, RemovedMemberWithoutALayoutMakesNull)
{
    const ISchema stored = NamedTupleOf({{"Gone", Plain(EType::List)}});

    EXPECT_EQ(nullptr, BuildEvolvingReader(NamedTupleOf({}), log.Node(0), stored));
}

TEST_F(EvolvingReaders, MemberThatFailedMakesNull)
{
    log.failAt = 0;
    const ISchema schema = NamedTupleOf({{"A", int8Schema}, {"B", int8Schema}});

    EXPECT_EQ(nullptr,
              BuildEvolvingReader(schema, log.Node(0, {log.Node(0), log.Node(1)}), schema));
    EXPECT_EQ(1u, log.contexts.size());
}

TEST_F(EvolvingReaders, TooFewNodesMakeNull)
{
    const ISchema named = NamedTupleOf({{"A", int8Schema}, {"B", int8Schema}});
    const ISchema onlyFirst = NamedTupleOf({{"A", int8Schema}});
    const ISchema tuple = TupleOf({int8Schema, int8Schema});

    EXPECT_EQ(nullptr, BuildEvolvingReader(named, log.Node(0, {log.Node(0)}), named));
    EXPECT_EQ(nullptr, BuildEvolvingReader(tuple, log.Node(0, {log.Node(0)}), tuple));
    EXPECT_EQ(nullptr, BuildEvolvingReader(ListOf(int8Schema), log.Node(0), ListOf(int8Schema)));
    // A node that is not needed may be missing.
    EXPECT_NE(nullptr, BuildEvolvingReader(named, log.Node(0, {log.Node(0)}), onlyFirst));
}

TEST_F(EvolvingReaders, OtherPartsAreMatchedByIndexAndMustBeAsMany)
{
    const ISchema stored = TupleOf({int8Schema, int16Schema});
    const ISchema current = TupleOf({int16Schema, int16Schema});

    EXPECT_NE(nullptr,
              BuildEvolvingReader(current, log.Node(0, {log.Node(1), log.Node(2)}), stored));
    ASSERT_EQ(3u, log.contexts.size());
    EXPECT_EQ(EType::Int8, log.contexts[0].StoredType);
    EXPECT_EQ(1u, log.contexts[0].Offset);
    EXPECT_EQ(EType::Int16, log.contexts[1].StoredType);

    EXPECT_EQ(nullptr, BuildEvolvingReader(current, log.Node(0, {log.Node(1), log.Node(2)}),
                                           TupleOf({int8Schema})));
    EXPECT_EQ(nullptr, BuildEvolvingReader(int8Schema, log.Node(0), TupleOf({int8Schema})));
}

TEST_F(EvolvingReaders, TupleBecomesANamedTupleByIndex)
{
    EXPECT_NE(nullptr, BuildEvolvingReader(NamedTupleOf({{"A", int8Schema}}),
                                           log.Node(0, {log.Node(1)}), TupleOf({int8Schema})));
    EXPECT_EQ(EType::Tuple, log.contexts.back().StoredType);
}

TEST_F(EvolvingReaders, ArrayOfAnotherLengthIsNoFailureHereAndAnErrorOfTheComparison)
{
    const ISchema stored = ArrayOf(int8Schema, 3);
    const ISchema current = ArrayOf(int8Schema, 4);
    std::vector<std::string> warnings;
    std::vector<std::string> errors;
    CompareSchemas(stored, current, warnings, errors);

    EXPECT_NE(nullptr, BuildEvolvingReader(current, log.Node(0, {log.Node(0)}), stored));
    EXPECT_EQ(1u, errors.size());
}

TEST_F(EvolvingReaders, RenumberedEnumIsMappedWithoutItsMaker)
{
    ReaderBuildNode node; // without a maker
    node.Offset = 12;

    const ReaderPointer reader =
        BuildEvolvingReader(EnumOf(EType::Enum32, {{"A", 20}, {"B", -3}}), node,
                            EnumOf(EType::Enum32, {{"A", 1}, {"LEGACY_B", 2}}));

    ASSERT_NE(nullptr, std::dynamic_pointer_cast<VReaderMappedEnum>(reader));
    EXPECT_EQ(12u, reader->DestinationOffset);
    EXPECT_EQ(0u, reader->FlatSize);
    std::int32_t number = 0;
    EXPECT_EQ(4, BytesRead(*reader, Bytes("\x02\x00\x00\x00rest"), &number));
    EXPECT_EQ(-3, number);
    EXPECT_EQ(4, BytesRead(*reader, Bytes("\x01\x00\x00\x00"), &number));
    EXPECT_EQ(20, number);
}

TEST_F(EvolvingReaders, EnumOfAnEmptyMappingGoesToItsMaker)
{
    const ISchema stored = EnumOf(EType::Enum8, {{"A", 1}});
    const ISchema current = EnumOf(EType::Enum32, {{"A", 1}, {"New", 2}});

    EXPECT_EQ(log.made, std::vector<ReaderPointer>());
    const ReaderPointer reader = BuildEvolvingReader(current, log.Node(3), stored);

    ASSERT_EQ(1u, log.contexts.size());
    EXPECT_EQ(EType::Enum8, log.contexts[0].StoredType);
    EXPECT_TRUE(log.contexts[0].Children.empty());
    EXPECT_EQ(log.made[0], reader);
}

TEST_F(EvolvingReaders, EnumThatLostANameMakesNull)
{
    EXPECT_EQ(nullptr, BuildEvolvingReader(EnumOf(EType::Enum32, {{"A", 1}}), log.Node(0),
                                           EnumOf(EType::Enum32, {{"A", 1}, {"B", 2}})));
    EXPECT_TRUE(log.contexts.empty());
}

TEST_F(EvolvingReaders, MappedEnumTakesFourBytesOfANarrowerOneWhichIsKept)
{
    const ReaderPointer reader = BuildEvolvingReader(
        EnumOf(EType::Enum8, {{"A", 2}}), ReaderBuildNode(), EnumOf(EType::Enum8, {{"A", 1}}));
    std::int32_t number = -1;

    EXPECT_EQ(-1, BytesRead(*reader, Bytes("\x01"), &number));
    EXPECT_EQ(4, BytesRead(*reader, Bytes("\x01\x00\x00\x00"), &number));
    EXPECT_EQ(2, number); // all four bytes of the destination are written
}

TEST(MappedEnumReader, ConsumesAnUnknownNumberAndLeavesTheDestination)
{
    VReaderMappedEnum reader({{1, 2}}, 0);
    const std::vector<unsigned char> bytes = Bytes("\x05\x00\x00\x00\x01\x00\x00\x00");
    Detail::VVectorReader cursor(bytes);
    IInputStreamAdapter<Detail::VVectorReader> stream(&cursor);
    std::int32_t number = 77;

    EXPECT_FALSE(reader.Read(stream, &number));
    EXPECT_EQ(77, number);
    EXPECT_EQ(4u, cursor.GetPosition());
    EXPECT_TRUE(reader.Read(stream, &number));
    EXPECT_EQ(2, number);
}

TEST(MappedEnumReader, ReadsNegativeNumbersAndWritesToAnyAddress)
{
    VReaderMappedEnum reader({{-1, -2}}, 0);
    unsigned char memory[6] = {9, 9, 9, 9, 9, 9};

    EXPECT_EQ(4, BytesRead(reader, Bytes("\xFF\xFF\xFF\xFF"), memory + 1));

    const unsigned char expected[6] = {9, 0xFE, 0xFF, 0xFF, 0xFF, 9};
    EXPECT_EQ(0, std::memcmp(expected, memory, sizeof(memory)));
}

TEST(MappedEnumReader, FailsAtTheEndOfTheStream)
{
    VReaderMappedEnum reader({{0, 1}}, 0);
    std::int32_t number = 77;

    EXPECT_EQ(-1, BytesRead(reader, Bytes("\x00\x00\x00"), &number));
    EXPECT_EQ(77, number);
}
