#pragma once

#include "DebugServices/AssertFailHandler.h"
#include "QuorixDataStore/DataListeners.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataVerifyReader.h"
#include "QuorixDataStore/DataVerifyWriter.h"
#include "QuorixDataStore/DataWriter.h"
#include "Variant/Interning.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <mutex>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace StoreTest {

using Texts = std::vector<std::string>;

inline VDataValue Byte(unsigned char number)
{
    return {&KVR::IO::GetUniquePodSchema(KVR::IO::EType::UInt8), {number}};
}

inline VDataValue Word(unsigned char low)
{
    return {&KVR::IO::GetUniquePodSchema(KVR::IO::EType::UInt16), {low, 0}};
}

inline VDataToken Token(const char* text)
{
    return VDataToken(VDataPath(text));
}

constexpr auto unknownTarget = static_cast<EDataValueTarget>(7);

/// Returns the paths of tokens as texts, in their order.
inline Texts PathsOf(const std::vector<VDataToken>& tokens)
{
    Texts texts;
    for (const VDataToken& token : tokens) {
        texts.push_back(token.GetPath().Text());
    }
    return texts;
}

inline Texts Find(const IDataReader& reader, const char* path)
{
    std::vector<VDataToken> tokens{Token("left.over")};
    const bool found = reader.FindTokens(VDataPath(path), tokens);
    EXPECT_EQ(found, !tokens.empty()) << path;
    return PathsOf(tokens);
}

inline Texts Children(const IDataReader& reader, const char* path)
{
    Texts names{"left over"};
    const bool found = reader.GetChildren(VDataPath(path), names);
    EXPECT_EQ(found, !names.empty()) << path;
    return names;
}

/// Returns the first byte of the value that a user sees, -1 for none.
inline int Current(const IDataReader& reader, const char* path)
{
    VDataValue value;
    return reader.GetValue(Token(path), value) ? value.Bytes.at(0) : -1;
}

inline int Proposed(const IDataVerifyReader& reader, const char* path)
{
    VDataValue value;
    return reader.GetProposedValue(Token(path), value) ? value.Bytes.at(0) : -1;
}

inline int Verified(const IDataVerifyReader& reader, const char* path)
{
    VDataValue value;
    return reader.GetVerifiedValue(Token(path), value) ? value.Bytes.at(0) : -1;
}

/// Returns the flags of an item, -1 where there is none.
inline int Flags(const IDataReader& reader, const char* path)
{
    std::uint32_t flags = 99;
    const bool found = reader.GetFlags(Token(path), flags);
    EXPECT_TRUE(found || flags == 0) << path;
    return found ? static_cast<int>(flags) : -1;
}

/// Takes the place of the assertion handler for its own lifetime, and returns or throws.
class VAssertions
{
public:
    enum EThen { Return, Throw };

    explicit VAssertions(EThen then)
    {
        previous = DebugServices::SetAssertFailHandler(
            [this, then](const char* expression, const char* file, int) {
                {
                    const std::lock_guard<std::mutex> lock(mutex);
                    expressions.emplace_back(expression);
                    files.emplace_back(file);
                }
                if (then == Throw) {
                    throw std::runtime_error(expression);
                }
            });
    }
    ~VAssertions() { DebugServices::SetAssertFailHandler(previous); }

    Texts Expressions() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return expressions;
    }

    Texts Files() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return files;
    }

private:
    DebugServices::AssertFailHandler previous;
    mutable std::mutex mutex;
    Texts expressions;
    Texts files;
};

/// A store with a few steps that most tests begin with.
class DataStoreFixture : public testing::Test
{
protected:
    /// Commits a value under the path, as the user's side.
    void Set(const char* path, const VDataValue& value)
    {
        VDataWriter writer(store);
        ASSERT_TRUE(writer.SetValue(Token(path), value)) << path;
    }

    void SetItems(const Texts& paths)
    {
        VDataWriter writer(store);
        for (const std::string& path : paths) {
            ASSERT_TRUE(writer.SetValue(Token(path.c_str()), Byte(1))) << path;
        }
    }

    /// Commits an item that asks for verification, with both values.
    void SetVerifiable(const char* path, unsigned char proposed, unsigned char verified)
    {
        VDataVerifyWriter writer(store);
        ASSERT_TRUE(writer.SetFlags(Token(path), EDataValueFlags::VerifyRequired));
        ASSERT_TRUE(writer.SetProposedValue(Token(path), Byte(proposed)));
        ASSERT_TRUE(writer.SetVerifiedValue(Token(path), Byte(verified)));
    }

    /// Writes down each call of the path's listeners as "<path> <kind>".
    void Listen(const char* path)
    {
        VDataWriter writer(store);
        VDataListeners& listeners = writer.GetListeners(VDataPath(path));
        const std::string name = path;
        const auto note = [this, name](const char* kind) {
            return [this, name, kind] {
                const std::lock_guard<std::mutex> lock(firedMutex);
                fired.push_back(name + " " + kind);
            };
        };
        listeners.OnProposalPending.Add(note("pending"));
        listeners.OnVerifiedChanged.Add(note("verified"));
        listeners.OnRemoved.Add(note("removed"));
        listeners.OnFlagsChanged.Add(note("flags"));
        listeners.OnAnyChange.Add(note("any"));
    }

    /// Returns what was called since the last time, in order.
    Texts Fired()
    {
        const std::lock_guard<std::mutex> lock(firedMutex);
        return std::exchange(fired, {});
    }

    /// As Fired, sorted, where the order within a set is free.
    Texts FiredInAnyOrder()
    {
        Texts calls = Fired();
        std::sort(calls.begin(), calls.end());
        return calls;
    }

    VDataStore store;

private:
    std::mutex firedMutex;
    Texts fired;
};

} // namespace StoreTest
