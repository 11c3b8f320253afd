#include "FileFixture.h"
#include "RandomItems.h"
#include "StoreFixture.h"
#include "io/Values.h"

#include <gmock/gmock.h>

#include <cmath>
#include <limits>
#include <map>

using namespace StoreTest;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

namespace {

/// What a file carries of an item.
struct VCarried
{
    bool Verify = false;
    VDataValue Proposed;
    VDataValue Verified;

    friend bool operator==(const VCarried& left, const VCarried& right)
    {
        return left.Verify == right.Verify && left.Proposed == right.Proposed &&
               left.Verified == right.Verified;
    }
};

using VCarriedItems = std::map<VDataPath, VCarried>;

VCarriedItems CarriedItems(const IDataStore& store)
{
    const VDataVerifyReader reader(store);
    std::vector<VDataToken> tokens;
    reader.FindTokens(VDataPath("*"), tokens);
    VCarriedItems items;
    for (const VDataToken& token : tokens) {
        VCarried item;
        std::uint32_t flags = 0;
        reader.GetFlags(token, flags);
        reader.GetVerifiedValue(token, item.Verified);
        if ((flags & EDataValueFlags::VerifyRequired) != 0) {
            reader.GetProposedValue(token, item.Proposed);
            item.Verify = !item.Proposed.Empty(); // the flag is told by the value alone
        }
        items.emplace(token.GetPath(), item);
    }
    return items;
}

void FillAtRandom(IDataStore& store, std::uint64_t seed)
{
    VRandomItems random(seed);
    VDataVerifyWriter writer(store);
    for (int count = 0; count < 40; ++count) {
        const VDataToken token(random.Path());
        const KVR::IO::ISchema& schema = random.Schema();
        const VDataValue value = random.Value(schema);
        // What has another type already, by chance, keeps it.
        if (random.Sometimes()) {
            writer.SetVerifiedValue(token, value);
        } else if (writer.SetFlags(token, EDataValueFlags::VerifyRequired)) {
            writer.SetProposedValue(token, value);
            if (random.Sometimes()) {
                writer.SetVerifiedValue(token, random.Value(schema));
            }
        }
    }
}

/// Writes a store and reads it back into another one.
VReadFile PassThroughAFile(const IDataStore& store, IDataStore& other)
{
    Texts errors;
    const std::string text = PrintStore(store, &errors);
    EXPECT_THAT(errors, IsEmpty());
    return ReadInto(other, text).value_or(VReadFile());
}

void Put(IDataStore& store, const VDataPath& path, const VDataValue& value)
{
    VDataVerifyWriter writer(store);
    EXPECT_TRUE(writer.SetVerifiedValue(VDataToken(path), value));
}

TEST(FileRoundTrip, RandomStoresComeBack)
{
    for (std::uint64_t seed = 0; seed < 200; ++seed) {
        VDataStore store, other;
        FillAtRandom(store, seed);

        const VReadFile file = PassThroughAFile(store, other);

        EXPECT_THAT(file.Errors, IsEmpty()) << "seed " << seed;
        EXPECT_THAT(file.Warnings, IsEmpty()) << "seed " << seed;
        ASSERT_EQ(CarriedItems(store), CarriedItems(other)) << "seed " << seed;
        ASSERT_EQ(PrintStore(store), PrintStore(other)) << "seed " << seed;
    }
}

TEST(FileRoundTrip, EveryPrintableCharacterComesBackInNamesAndTexts)
{
    VDataStore store, other;
    for (int character = 1; character < 256; ++character) {
        const std::string text = "x" + std::string(1, static_cast<char>(character));
        Put(store, VDataPath{text, text}, MakeStringValue(text));
    }

    EXPECT_TRUE(PassThroughAFile(store, other).Good);

    EXPECT_EQ(CarriedItems(store), CarriedItems(other));
    EXPECT_EQ(CarriedItems(other).size(), 255U);
}

// What a file does not carry, each in a test of its own.

TEST(FileRoundTrip, FlagsBesideVerifyRequiredAreLost)
{
    VDataStore store, other;
    Put(store, VDataPath("A.B"), Byte(1));
    {
        VDataVerifyWriter(store).SetFlags(Token("A.B"), EDataValueFlags::ReadOnly |
                                                            EDataValueFlags::NotSerialized | 64);
    }

    PassThroughAFile(store, other);

    EXPECT_EQ(Flags(VDataVerifyReader(other), "A.B"), 0);
}

TEST(FileRoundTrip, VerifyRequiredWithoutAProposedValueIsLost)
{
    VDataStore store, other;
    {
        VDataVerifyWriter writer(store);
        writer.SetFlags(Token("A.B"), EDataValueFlags::VerifyRequired);
        writer.SetVerifiedValue(Token("A.B"), Byte(1));
    }

    PassThroughAFile(store, other);

    EXPECT_EQ(Flags(VDataVerifyReader(other), "A.B"), 0);
    EXPECT_EQ(Verified(VDataVerifyReader(other), "A.B"), 1);
}

TEST(FileRoundTrip, AnItemOfOneComponentIsLost)
{
    VDataStore store, other;
    Put(store, VDataPath("A"), Byte(1));
    Put(store, VDataPath("B.C"), Byte(2));

    EXPECT_THAT(PassThroughAFile(store, other).Warnings,
                ElementsAre("Ignoring unrecognised element type: /Configuration/Item"));

    EXPECT_THAT(Find(VDataVerifyReader(other), "*"), ElementsAre("B.C"));
}

TEST(FileRoundTrip, EmptyNamesAreLost)
{
    VDataStore store, other;
    Put(store, VDataPath{"A", ""}, Byte(1));
    Put(store, VDataPath{"", "A"}, Byte(1));
    Put(store, VDataPath{"A", "A"}, Byte(1));

    EXPECT_EQ(PassThroughAFile(store, other).Errors.size(), 2U);

    EXPECT_THAT(Find(VDataVerifyReader(other), "*"), ElementsAre("A.A"));
}

TEST(FileRoundTrip, AWildcardIsNoNameInAStoreEither)
{
    VDataStore store;
    VDataVerifyWriter writer(store);

    EXPECT_FALSE(writer.SetVerifiedValue(VDataToken(VDataPath{"A", "*"}), Byte(1)));
}

TEST(FileRoundTrip, ZerosInNamesAndTextsAreLost)
{
    const std::string zero(1, '\0');
    VDataStore store, other;
    Put(store, VDataPath{"A", "n" + zero}, Byte(1));
    Put(store, VDataPath("A.Text"), MakeStringValue("t" + zero));
    Put(store, VDataPath("A.Whole"), Byte(1));

    ReadInto(other, PrintStore(store));

    EXPECT_THAT(Find(VDataVerifyReader(other), "*"), ElementsAre("A.Whole"));
}

TEST(FileRoundTrip, TabsInTheNamesOfASchemaGrow)
{
    KVR::IO::ISchema schema;
    schema.Type = KVR::IO::EType::UInt8;
    schema.TypeName = "a\tb";
    VDataStore store, other;
    Put(store, VDataPath("A.B"), {&KVR::IO::GetUniqueSchema(schema), {1}});

    PassThroughAFile(store, other);

    EXPECT_EQ(VDataVerifyReader(other).GetValue(Token("A.B")).Schema->TypeName, "a\ttb");
}

TEST(FileRoundTrip, TheLastDigitsOfRealNumbersAreLost)
{
    VDataStore store, other;
    const double numbers[] = {0.1 + 0.2, 1.0 / 3.0, 123456.789, 1e-300, 5e-324};
    for (std::size_t index = 0; index < std::size(numbers); ++index) {
        Put(store, VDataPath{"A", std::to_string(index)}, MakeDoubleValue(numbers[index]));
    }

    EXPECT_TRUE(PassThroughAFile(store, other).Good);

    bool drifted = false;
    for (std::size_t index = 0; index < std::size(numbers); ++index) {
        const VDataToken token(VDataPath{"A", std::to_string(index)});
        double read = 0;
        ASSERT_TRUE(ReadValue(VDataVerifyReader(other).GetValue(token), read));
        EXPECT_NEAR(read, numbers[index], std::abs(numbers[index]) * 1e-14);
        drifted = drifted || read != numbers[index];
    }
    EXPECT_TRUE(drifted);
}

TEST(FileRoundTrip, PendingChangesAreWrittenAndComeBack)
{
    VDataStore store, other;
    FillAtRandom(store, 1);
    std::string text;
    {
        VDataVerifyWriter writer(store);
        writer.SetVerifiedValue(Token("New.Item"), Byte(1));
        text = PrintConfiguration(writer);
    }

    EXPECT_TRUE(ReadInto(other, text)->Good);

    EXPECT_EQ(CarriedItems(store), CarriedItems(other));
    EXPECT_EQ(text, PrintStore(store));
}

} // namespace
