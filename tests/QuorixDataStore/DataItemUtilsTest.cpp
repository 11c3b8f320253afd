#include "QuorixDataStore/DataItemUtils.h"

#include "QuorixDataStore/DataItem.h"
#include "QuorixDataStore/DataValueFlags.h"
#include "Variant/Interning.h"
#include "support/LogCapture.h"

#include <gtest/gtest.h>

#include <vector>

namespace {

using Texts = std::vector<std::string>;

constexpr auto unknownTarget = static_cast<EDataValueTarget>(7);
constexpr std::uint32_t verifyRequired = EDataValueFlags::VerifyRequired;

VDataValue Value(unsigned char byte)
{
    return {&KVR::IO::GetUniquePodSchema(KVR::IO::EType::UInt8), {byte}};
}

/// Reads from proposed 1 and verified 2, over a destination that holds 9; 0 stands for false.
int ReadByte(EDataValueTarget target, std::uint32_t flags)
{
    VDataValue destination = Value(9);
    const bool done =
        DataItemUtils::Read(VDataPath("A.B"), target, flags, Value(1), Value(2), destination);
    return done ? destination.Bytes.at(0) : 0;
}

struct VWritten
{
    bool done;
    std::size_t proposed;
    std::size_t verified;

    bool operator==(const VWritten& other) const
    {
        return done == other.done && proposed == other.proposed && verified == other.verified;
    }
};

/// Writes to an item without values and tells how many bytes landed where.
VWritten Write(EDataValueTarget target, std::uint32_t flags)
{
    VDataValue proposed;
    VDataValue verified;
    const bool done =
        DataItemUtils::Write(VDataPath("A.B"), target, flags, Value(5), proposed, verified);
    return {done, proposed.Bytes.size(), verified.Bytes.size()};
}

TEST(DataItemUtils, FlagAndTargetNumbers)
{
    EXPECT_EQ(1u, EDataValueFlags::ReadOnly);
    EXPECT_EQ(2u, EDataValueFlags::VerifyRequired);
    EXPECT_EQ(4u, EDataValueFlags::NotSerialized);
    EXPECT_EQ(1u, static_cast<std::uint32_t>(EDataValueTarget::Proposed));
    EXPECT_EQ(2u, static_cast<std::uint32_t>(EDataValueTarget::Verified));
    EXPECT_EQ(3u, static_cast<std::uint32_t>(EDataValueTarget::Current));
}

TEST(DataItemUtils, ReadsByTarget)
{
    const TestSupport::VLogCapture log;

    EXPECT_EQ(2, ReadByte(EDataValueTarget::Current, 0));
    EXPECT_EQ(1, ReadByte(EDataValueTarget::Current, verifyRequired));
    EXPECT_EQ(2, ReadByte(EDataValueTarget::Verified, 0));
    EXPECT_EQ(2, ReadByte(EDataValueTarget::Verified, verifyRequired));
    EXPECT_EQ(1, ReadByte(EDataValueTarget::Proposed, verifyRequired));
    EXPECT_EQ(2, ReadByte(EDataValueTarget::Current, EDataValueFlags::ReadOnly));
    EXPECT_TRUE(log.Messages().empty());
}

TEST(DataItemUtils, ReadingProposedWithoutVerifyRequiredWarnsAndReadsVerified)
{
    const TestSupport::VLogCapture log;

    EXPECT_EQ(2, ReadByte(EDataValueTarget::Proposed, 0));

    ASSERT_EQ(1u, log.Messages().size());
    EXPECT_EQ(
        "Attempt to get Proposed value without flag EDataValueFlags::VerifyRequired for value "
        "'A.B'.",
        log.Messages()[0].Text);
    EXPECT_EQ(3, log.Messages()[0].Level);
    EXPECT_EQ("DataStore", log.Messages()[0].Category);
}

TEST(DataItemUtils, ReadingAnUnknownTargetWithoutVerifyRequiredSilentlyReadsVerifiedIsKept)
{
    const TestSupport::VLogCapture log;

    EXPECT_EQ(2, ReadByte(unknownTarget, 0));
    EXPECT_EQ(2, ReadByte(static_cast<EDataValueTarget>(0), 0));

    EXPECT_TRUE(log.Messages().empty());
}

TEST(DataItemUtils, ReadingAnUnknownTargetWithVerifyRequiredFails)
{
    const TestSupport::VLogCapture log;

    EXPECT_EQ(0, ReadByte(unknownTarget, verifyRequired));

    ASSERT_EQ(1u, log.Messages().size());
    EXPECT_EQ("Unknown value target while trying to read value 'A.B'.", log.Messages()[0].Text);
    EXPECT_EQ(2, log.Messages()[0].Level);
    EXPECT_EQ("DataStore", log.Messages()[0].Category);
}

TEST(DataItemUtils, ReadingAnEmptyValueLeavesTheDestination)
{
    VDataValue destination = Value(9);

    EXPECT_TRUE(DataItemUtils::Read(VDataPath("A"), EDataValueTarget::Current, verifyRequired,
                                    VDataValue(), Value(2), destination));

    EXPECT_EQ(Value(9), destination);
}

TEST(DataItemUtils, ReadingReplacesANullSchemaByVoid)
{
    VDataValue destination = Value(9);

    EXPECT_TRUE(DataItemUtils::Read(VDataPath("A"), EDataValueTarget::Current, 0, VDataValue(),
                                    VDataValue{nullptr, {1}}, destination));

    EXPECT_EQ(&KVR::IO::GetUniquePodSchema(KVR::IO::EType::Void), destination.Schema);
}

TEST(DataItemUtils, WritesByTarget)
{
    const TestSupport::VLogCapture log;

    EXPECT_EQ((VWritten{true, 0, 1}), Write(EDataValueTarget::Current, 0));
    EXPECT_EQ((VWritten{true, 1, 0}), Write(EDataValueTarget::Current, verifyRequired));
    EXPECT_EQ((VWritten{true, 0, 1}), Write(EDataValueTarget::Verified, 0));
    EXPECT_EQ((VWritten{true, 0, 1}), Write(EDataValueTarget::Verified, verifyRequired));
    EXPECT_EQ((VWritten{true, 1, 0}), Write(EDataValueTarget::Proposed, verifyRequired));
    EXPECT_TRUE(log.Messages().empty());
}

TEST(DataItemUtils, WritingProposedWithoutVerifyRequiredWarnsAndWritesVerified)
{
    const TestSupport::VLogCapture log;

    EXPECT_EQ((VWritten{true, 0, 1}), Write(EDataValueTarget::Proposed, 0));

    ASSERT_EQ(1u, log.Messages().size());
    EXPECT_EQ(
        "Attempt to set Proposed value without flag EDataValueFlags::VerifyRequired for value "
        "'A.B'.",
        log.Messages()[0].Text);
    EXPECT_EQ(3, log.Messages()[0].Level);
}

TEST(DataItemUtils, WritingAnUnknownTargetWithoutVerifyRequiredSilentlyWritesVerifiedIsKept)
{
    const TestSupport::VLogCapture log;

    EXPECT_EQ((VWritten{true, 0, 1}), Write(unknownTarget, 0));

    EXPECT_TRUE(log.Messages().empty());
}

TEST(DataItemUtils, WritingAnUnknownTargetWithVerifyRequiredWritesNothing)
{
    const TestSupport::VLogCapture log;

    EXPECT_EQ((VWritten{false, 0, 0}), Write(unknownTarget, verifyRequired));

    ASSERT_EQ(1u, log.Messages().size());
    EXPECT_EQ("Unknown value target while trying to set value 'A.B'.", log.Messages()[0].Text);
    EXPECT_EQ(2, log.Messages()[0].Level);
}

TEST(DataItemUtils, SettingVerifyRequiredMovesVerifiedToProposedAndBack)
{
    VDataValue proposed;
    VDataValue verified = Value(2);

    DataItemUtils::MoveForFlags(0, verifyRequired, proposed, verified);
    EXPECT_EQ(Value(2), proposed);
    EXPECT_TRUE(verified.Empty());
    EXPECT_EQ(nullptr, verified.Schema);

    DataItemUtils::MoveForFlags(verifyRequired, 0, proposed, verified);
    EXPECT_TRUE(proposed.Empty());
    EXPECT_EQ(Value(2), verified);
}

TEST(DataItemUtils, AnEmptyValueMovesNothing)
{
    VDataValue proposed = Value(1);
    VDataValue verified;

    DataItemUtils::MoveForFlags(0, verifyRequired, proposed, verified);
    EXPECT_EQ(Value(1), proposed);

    proposed = VDataValue();
    verified = Value(2);
    DataItemUtils::MoveForFlags(verifyRequired, 0, proposed, verified);
    EXPECT_EQ(Value(2), verified);
}

TEST(DataItemUtils, OnlyAChangeOfVerifyRequiredMoves)
{
    VDataValue proposed;
    VDataValue verified = Value(2);

    DataItemUtils::MoveForFlags(0, EDataValueFlags::ReadOnly | EDataValueFlags::NotSerialized,
                                proposed, verified);
    DataItemUtils::MoveForFlags(verifyRequired, verifyRequired | EDataValueFlags::ReadOnly,
                                proposed, verified);

    EXPECT_TRUE(proposed.Empty());
    EXPECT_EQ(Value(2), verified);
}

TEST(DataItemUtils, ANewItemHasNothing)
{
    const VDataItem item;

    EXPECT_TRUE(item.Path.Empty());
    EXPECT_TRUE(item.Proposed.Empty());
    EXPECT_TRUE(item.Verified.Empty());
    EXPECT_EQ(0u, item.Flags);
    EXPECT_EQ(nullptr, item.Node);
    EXPECT_EQ(0u, item.ItemIdentifier);
}

} // namespace
