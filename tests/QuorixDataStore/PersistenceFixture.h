#pragma once

#include "QuorixDataStore/DataStorePersistence.h"
#include "StoreFixture.h"
#include "support/LogCapture.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <set>
#include <string>
#include <utility>

namespace StoreTest {

/// A target that refuses what it is told to refuse.
class VRefusingWriter : public VDataVerifyWriter
{
public:
    VRefusingWriter(IDataStore& store, std::set<std::string> refused)
        : VDataVerifyWriter(store), refused(std::move(refused))
    {
    }

    bool SetFlags(const VDataToken& token, std::uint32_t flags) override
    {
        return refused.count("flags") == 0 && VDataVerifyWriter::SetFlags(token, flags);
    }
    bool SetProposedValue(const VDataToken& token, const VDataValue& value) override
    {
        return refused.count("proposed") == 0 && VDataVerifyWriter::SetProposedValue(token, value);
    }
    bool SetVerifiedValue(const VDataToken& token, const VDataValue& value) override
    {
        return refused.count("verified") == 0 && VDataVerifyWriter::SetVerifiedValue(token, value);
    }
    bool Remove(const VDataToken& token) override
    {
        return refused.count("remove") == 0 && VDataVerifyWriter::Remove(token);
    }

private:
    const std::set<std::string> refused;
};

/// A view that cannot tell an item's flags.
template <typename View>
class VFlagless : public View
{
public:
    using View::View;

    bool GetFlags(const VDataToken&, std::uint32_t& flags) const override
    {
        flags = 0xFF; // left behind by a failed read
        return false;
    }
};

using VFlaglessReader = VFlagless<VDataVerifyReader>;
using VFlaglessWriter = VFlagless<VDataVerifyWriter>;

/// One item as a store holds it.
struct VItem
{
    bool Exists = false;
    std::uint32_t Flags = 0;
    VDataValue Proposed;
    VDataValue Verified;
};

class PersistenceFixture : public testing::Test
{
protected:
    static void Put(IDataStore& store, const char* path, std::uint32_t flags,
                    const VDataValue& verified, const VDataValue& proposed = VDataValue())
    {
        VDataVerifyWriter writer(store);
        if (flags != 0) {
            EXPECT_TRUE(writer.SetFlags(Token(path), flags));
        }
        if (!verified.Empty()) {
            EXPECT_TRUE(writer.SetVerifiedValue(Token(path), verified));
        }
        if (!proposed.Empty()) {
            EXPECT_TRUE(writer.SetProposedValue(Token(path), proposed));
        }
    }

    static VItem Get(const IDataStore& store, const char* path)
    {
        const VDataVerifyReader reader(store);
        VItem item;
        item.Exists = reader.GetFlags(Token(path), item.Flags);
        reader.GetVerifiedValue(Token(path), item.Verified);
        if ((item.Flags & EDataValueFlags::VerifyRequired) != 0) {
            reader.GetProposedValue(Token(path), item.Proposed);
        }
        return item;
    }

    EDataCopyResult Copy(const char* path, std::uint32_t options,
                         const std::set<std::string>& refused = {})
    {
        const VDataVerifyReader reader(source);
        VRefusingWriter writer(target, refused);
        return DataStorePersistence::CopyValue(Token(path), reader, writer, options);
    }

    EDataCopyResult CopyAllOf(const char* path, std::uint32_t options,
                              const std::set<std::string>& refused = {})
    {
        const VDataVerifyReader reader(source);
        VRefusingWriter writer(target, refused);
        return DataStorePersistence::CopyValues(VDataPath(path), reader, writer, options);
    }

    /// Returns what was logged to the store's category, each with its level.
    Texts Logged() const
    {
        Texts lines;
        for (const TestSupport::VLoggedMessage& message : log.Messages()) {
            if (message.Category == "DataStore") {
                lines.push_back(std::to_string(message.Level) + ": " + message.Text);
            }
        }
        return lines;
    }

    const TestSupport::VLogLevel level{"DataStore", 6};
    const TestSupport::VLogCapture log;
    VDataStore source;
    VDataStore target;
};

} // namespace StoreTest
