#include "StoreFixture.h"
#include "WorkerThread.h"
#include "support/LogCapture.h"

#include <gtest/gtest.h>

#include <memory>

namespace {

using namespace StoreTest;

using DataStoreListeners = DataStoreFixture;

constexpr std::uint32_t verifyRequired = EDataValueFlags::VerifyRequired;

TEST_F(DataStoreListeners, KindsFireInTheirOrderAndAnyChangeLast)
{
    SetItems({"A.Gone", "A.Set", "A.Flags"});
    Listen("A.*");
    {
        VDataWriter writer(store);
        writer.SetFlags(Token("A.Flags"), 1);
        writer.SetValue(Token("A.Set"), Byte(2));
        writer.SetFlags(Token("A.Pending"), verifyRequired);
        writer.SetValue(Token("A.Pending"), Byte(2));
        writer.Remove(Token("A.Gone"));
    }

    EXPECT_EQ((Texts{"A.* removed", "A.* pending", "A.* verified", "A.* flags", "A.* any"}),
              Fired());
}

TEST_F(DataStoreListeners, KindsFireInTheirOrderAcrossRecords)
{
    SetItems({"Gone", "Set", "Flags"});
    for (const char* path : {"Gone", "Set", "Flags", "Pending"}) {
        Listen(path);
    }
    {
        VDataWriter writer(store);
        writer.SetFlags(Token("Flags"), 1);
        writer.SetValue(Token("Set"), Byte(2));
        writer.SetFlags(Token("Pending"), verifyRequired);
        writer.SetValue(Token("Pending"), Byte(2));
        writer.Remove(Token("Gone"));
    }
    Texts fired = Fired();
    ASSERT_EQ(9u, fired.size());
    EXPECT_EQ("Gone removed", fired[0]);
    EXPECT_EQ("Pending pending", fired[1]);
    EXPECT_EQ("Set verified", fired[2]);
    std::sort(fired.begin() + 3, fired.begin() + 5);
    EXPECT_EQ("Flags flags", fired[3]);
    EXPECT_EQ("Pending flags", fired[4]);
    std::sort(fired.begin() + 5, fired.end());
    EXPECT_EQ((Texts{"Flags any", "Gone any", "Pending any", "Set any"}),
              Texts(fired.begin() + 5, fired.end()));
}

TEST_F(DataStoreListeners, OneListenerHearsOncePerKindHoweverManyItems)
{
    Listen("A.*");
    {
        VDataWriter writer(store);
        for (const char* path : {"A.B", "A.C", "A.D.E", "A.D"}) {
            writer.SetValue(Token(path), Byte(1));
            writer.SetFlags(Token(path), 1);
        }
    }

    EXPECT_EQ((Texts{"A.* verified", "A.* flags", "A.* any"}), Fired());
}

TEST_F(DataStoreListeners, ListenersOfEveryShapeHearOfWhatTheyName)
{
    for (const char* path : {"*", "A", "A.*", "A.B", "A.*.*", "A.*.C", "A.B.*", "*.B", "*.B.*",
                             "*.*", "*.*.*", "X.*", "A.B.C.D", "A.*.C.*", ""}) {
        Listen(path);
    }
    unsigned char value = 0;
    const auto firedFor = [this, &value](const char* path) {
        Set(path, Byte(++value));
        Texts names;
        for (const std::string& call : FiredInAnyOrder()) {
            if (call.find(" any") != std::string::npos) {
                names.push_back(call.substr(0, call.find(' ')));
            }
        }
        return names;
    };

    EXPECT_EQ((Texts{"*", "A"}), firedFor("A"));
    EXPECT_EQ((Texts{"*", "*.*", "*.B", "A.*", "A.B"}), firedFor("A.B"));
    EXPECT_EQ((Texts{"*", "*.*", "A.*"}), firedFor("A.X"));
    EXPECT_EQ((Texts{"*", "*.*", "*.*.*", "*.B.*", "A.*", "A.*.*", "A.*.C", "A.B.*"}),
              firedFor("A.B.C"));
    EXPECT_EQ((Texts{"*", "*.*", "*.*.*", "A.*", "A.*.*", "A.*.C"}), firedFor("A.X.C"));
    EXPECT_EQ((Texts{"*", "*.*", "*.*.*", "*.B.*", "A.*", "A.*.*", "A.*.C.*", "A.B.*", "A.B.C.D"}),
              firedFor("A.B.C.D"));
    EXPECT_EQ((Texts{"*", "*.*", "X.*"}), firedFor("X.Y"));
    EXPECT_EQ((Texts{"*"}), firedFor("Z"));
}

TEST_F(DataStoreListeners, RemovedListenerPathBelowRemovedItemHearsOnlyOfItsOwn)
{
    SetItems({"A", "A.B"});
    Listen("A");
    Listen("A.B");
    {
        VDataWriter writer(store);
        writer.Remove(Token("A"));
    }

    EXPECT_EQ((Texts{"A removed", "A any"}), Fired());
}

TEST_F(DataStoreListeners, ProposalFiresPendingUntilItIsVerified)
{
    {
        VDataWriter writer(store);
        writer.SetFlags(Token("A"), verifyRequired);
    }
    Listen("A");

    Set("A", Byte(5));
    EXPECT_EQ((Texts{"A pending", "A any"}), Fired());
    {
        VDataVerifyWriter writer(store);
        writer.SetVerifiedValue(Token("A"), Byte(4));
    }
    EXPECT_EQ((Texts{"A pending", "A verified", "A any"}), Fired()) << "not what was asked for";
    {
        VDataVerifyWriter writer(store);
        writer.SetVerifiedValue(Token("A"), Byte(5));
    }
    EXPECT_EQ((Texts{"A verified", "A any"}), Fired());

    Set("Other", Byte(1));
    EXPECT_EQ(Texts{}, Fired());
}

TEST_F(DataStoreListeners, PendingPathsFireAgainAtEveryCommitWithChangesIsKept)
{
    SetVerifiable("A", 5, 4);
    Listen("A");

    Set("Other", Byte(1));
    EXPECT_EQ((Texts{"A pending", "A any"}), Fired());
    Set("Other", Byte(2));
    EXPECT_EQ((Texts{"A pending", "A any"}), Fired());

    VDataWriter(static_cast<IDataStore&>(store)); // no changes, no reminder
    EXPECT_EQ(Texts{}, Fired());
}

TEST_F(DataStoreListeners, RestoredChangesGiveNoReminder)
{
    SetVerifiable("A", 5, 4);
    Set("Other", Byte(1));
    Listen("A");
    {
        VDataWriter writer(store);
        writer.RemoveAllRestorable(VDataPath("Other"));
        writer.SetValue(Token("Other"), Byte(1));
    }

    EXPECT_EQ(Texts{}, Fired());
}

TEST_F(DataStoreListeners, RemovalEndsThePendingPath)
{
    SetVerifiable("A", 5, 4);
    Listen("A");
    {
        VDataWriter writer(store);
        writer.Remove(Token("A"));
    }
    EXPECT_EQ((Texts{"A removed", "A any"}), Fired());

    Set("Other", Byte(1));
    EXPECT_EQ(Texts{}, Fired());
}

TEST_F(DataStoreListeners, ClearingVerifyRequiredLeavesThePendingPathAsItIsIsKept)
{
    SetVerifiable("A", 5, 4);
    Listen("A");
    {
        VDataWriter writer(store);
        writer.SetFlags(Token("A"), 0);
    }
    EXPECT_EQ((Texts{"A pending", "A flags", "A any"}), Fired());
    EXPECT_EQ(5, Current(VDataReader(store), "A"));

    Set("Other", Byte(1));
    EXPECT_EQ((Texts{"A pending", "A any"}), Fired());
}

TEST_F(DataStoreListeners, SettingVerifyRequiredMakesTheValueAPendingProposal)
{
    Set("A", Byte(5));
    Listen("A");
    {
        VDataWriter writer(store);
        writer.SetFlags(Token("A"), verifyRequired);
    }

    EXPECT_EQ((Texts{"A pending", "A flags", "A any"}), Fired());
}

TEST_F(DataStoreListeners, ProposedValueUnderAnotherTypeNameStaysPending)
{
    KVR::IO::ISchema named = *Byte(0).Schema;
    named.TypeName = "Percentage";
    {
        VDataVerifyWriter writer(store);
        writer.SetFlags(Token("A"), verifyRequired);
        writer.SetProposedValue(Token("A"), {&KVR::IO::GetUniqueSchema(named), {1}});
        writer.SetVerifiedValue(Token("A"), Byte(1));
    }
    Listen("A");

    Set("Other", Byte(1));

    EXPECT_EQ((Texts{"A pending", "A any"}), Fired());
}

TEST_F(DataStoreListeners, ListenersRunOnTheThreadThatLetGoLast)
{
    std::thread::id firedOn;
    {
        VDataWriter writer(store);
        writer.GetListeners(VDataPath("A")).OnVerifiedChanged.Add([&] {
            firedOn = std::this_thread::get_id();
        });
    }
    VWorkerThread readerThread;
    std::unique_ptr<VDataReader> reader;
    std::thread::id readerId;
    readerThread.Do([&] {
        reader = std::make_unique<VDataReader>(store);
        readerId = std::this_thread::get_id();
    });
    {
        VDataWriter writer(store);
        writer.SetValue(Token("A"), Byte(1));
    }
    EXPECT_EQ(std::thread::id(), firedOn) << "the reader still holds the state";
    EXPECT_EQ(1u, VDataReader(store).GetCurrentChangeId() - 1) << "its writer sees what is pending";

    readerThread.Do([&] {
        EXPECT_EQ(-1, Current(*reader, "A")) << "the tree does not change under a reader";
        EXPECT_EQ(1u, reader->GetCurrentChangeId());
        reader.reset();
    });

    EXPECT_EQ(readerId, firedOn);
    EXPECT_EQ(1, Current(VDataReader(store), "A"));
}

TEST_F(DataStoreListeners, ListenerMayMakeViewsAndHearsOfItsOwnWrites)
{
    int seen = -1;
    {
        VDataWriter writer(store);
        writer.GetListeners(VDataPath("A")).OnVerifiedChanged.Add([&] {
            seen = Current(VDataReader(store), "A");
            VDataWriter inner(store);
            inner.SetValue(Token("B"), Byte(2));
        });
    }
    Listen("B");

    Set("A", Byte(1));

    EXPECT_EQ(1, seen);
    EXPECT_EQ((Texts{"B verified", "B any"}), Fired());
}

TEST_F(DataStoreListeners, ListenersNestByPlainRecursion)
{
    Texts order;
    {
        VDataWriter writer(store);
        writer.GetListeners(VDataPath("A")).OnVerifiedChanged.Add([&] {
            order.push_back("A begins");
            VDataWriter(store).SetValue(Token("B"), Byte(2));
            order.push_back("A ends");
        });
        writer.GetListeners(VDataPath("B")).OnVerifiedChanged.Add([&] { order.push_back("B"); });
        writer.GetListeners(VDataPath("A")).OnAnyChange.Add([&] { order.push_back("A any"); });
    }

    Set("A", Byte(1));

    EXPECT_EQ((Texts{"A begins", "B", "A ends", "A any"}), order);
}

TEST_F(DataStoreListeners, ALaterCommitsListenersMayRunBeforeAnEarlierOnesAreThrough)
{
    Texts order;
    VWorkerThread other;
    {
        VDataWriter writer(store);
        writer.GetListeners(VDataPath("A")).OnVerifiedChanged.Add([&] {
            order.push_back("A begins");
            other.Do([this] { Set("B", Byte(1)); }); // would hang if anything were locked here
            order.push_back("A ends");
        });
        writer.GetListeners(VDataPath("B")).OnAnyChange.Add([&] { order.push_back("B"); });
    }

    Set("A", Byte(1));

    EXPECT_EQ((Texts{"A begins", "B", "A ends"}), order);
    EXPECT_EQ(3u, VDataReader(store).GetCurrentChangeId());
}

TEST_F(DataStoreListeners, ListenerThatWritesToAStoreThatItsThreadReadsIsFatal)
{
    VDataStore listening;
    {
        VDataWriter writer(listening);
        writer.GetListeners(VDataPath("A")).OnVerifiedChanged.Add([this] {
            VDataWriter inner(store);
        });
    }
    VAssertions assertions(VAssertions::Return);
    const VDataReader outer(store);
    {
        VDataWriter writer(listening);
        writer.SetValue(Token("A"), Byte(1));
    }

    EXPECT_EQ((Texts{"Fatal attempt to acquire a write lock from within a read lock."}),
              assertions.Expressions());
    EXPECT_EQ(0u, outer.GetCurrentChangeId());
}

TEST_F(DataStoreListeners, MadeForAPathWhileACommitFiresHearOfTheNext)
{
    Texts heard;
    {
        VDataWriter writer(store);
        writer.GetListeners(VDataPath("A.B")).OnVerifiedChanged.Add([&] {
            VDataWriter inner(store);
            inner.GetListeners(VDataPath("A.*")).OnVerifiedChanged.Add([&] {
                heard.push_back("A.*");
            });
            heard.push_back("A.B");
        });
    }

    Set("A.B", Byte(1));
    EXPECT_EQ((Texts{"A.B"}), heard);

    Set("A.C", Byte(1));
    EXPECT_EQ((Texts{"A.B", "A.*"}), heard);
}

TEST_F(DataStoreListeners, ThrowingListenerIsLoggedAndTheOthersStillFire)
{
    Listen("A");
    Listen("B");
    {
        VDataWriter writer(store);
        for (const char* path : {"A", "B"}) {
            writer.GetListeners(VDataPath(path)).OnVerifiedChanged.Clear();
            writer.GetListeners(VDataPath(path)).OnVerifiedChanged.Add([] {
                throw std::runtime_error("no such lens");
            });
        }
        writer.GetListeners(VDataPath("B")).OnFlagsChanged.Add([] { throw 7; });
    }
    const TestSupport::VLogCapture log;
    {
        VDataWriter writer(store);
        writer.SetValue(Token("A"), Byte(1));
        writer.SetValue(Token("B"), Byte(1));
        writer.SetFlags(Token("B"), 1);
    }

    EXPECT_EQ((Texts{"A any", "B any", "B flags"}), FiredInAnyOrder());
    ASSERT_EQ(3u, log.Messages().size());
    EXPECT_NE(std::string::npos, log.Messages()[0].Text.find("no such lens"));
    for (const TestSupport::VLoggedMessage& message : log.Messages()) {
        EXPECT_EQ("DataStore", message.Category);
        EXPECT_EQ(2, message.Level);
    }
    EXPECT_EQ(1, Current(VDataReader(store), "B"));
}

TEST_F(DataStoreListeners, ListenerMayLetGoOfTheStore)
{
    auto owned = std::make_shared<VDataStore>();
    VDataStore& alias = *owned;
    {
        VDataWriter writer(alias);
        writer.GetListeners(VDataPath("A")).OnRemoved.Add([&] { owned.reset(); });
        writer.GetListeners(VDataPath("A")).OnAnyChange.Add([this] { Set("Done", Byte(1)); });
        writer.SetValue(Token("A"), Byte(1));
    }
    std::uint64_t changeId = 0;
    ASSERT_TRUE(alias.AcquireWriteLock(changeId));
    alias.Remove(Token("A"), false);

    alias.ReleaseWriteLock();

    EXPECT_EQ(nullptr, owned);
    EXPECT_EQ(1, Current(VDataReader(store), "Done"));
}

TEST_F(DataStoreListeners, ListenersStayAtTheirAddress)
{
    VDataListeners* first = nullptr;
    {
        VDataWriter writer(store);
        first = &writer.GetListeners(VDataPath("A.*"));
        for (int index = 0; index < 1000; ++index) {
            writer.GetListeners(VDataPath("A.B" + std::to_string(index)));
        }
        EXPECT_EQ(first, &writer.GetListeners(VDataPath("A.*")));
        EXPECT_NE(first, &writer.GetListeners(VDataPath("A")));
    }
    EXPECT_EQ(first, &std::as_const(store).GetListeners(VDataPath("A.*")));
}

TEST_F(DataStoreListeners, DeepPathsAreFine)
{
    VDataPath path;
    for (int depth = 0; depth < 20000; ++depth) {
        path.Append("d");
    }
    int heard = 0;
    VDataWriter writer(store);
    for (const char* last : {"*", "e"}) {
        writer.GetListeners(VDataPath(path, last)).OnVerifiedChanged.Add([&] { ++heard; });
    }
    EXPECT_TRUE(writer.SetValue(VDataToken(VDataPath(path, "e")), Byte(1)));

    {
        const VDataWriter last(std::move(writer));
    }
    EXPECT_EQ(2, heard);
}

TEST_F(DataStoreListeners, ReadOnlyLookUpMakesNothing)
{
    const IDataStore& reading = store;
    const VDataListeners& none = reading.GetListeners(VDataPath("A.B"));
    Listen("A.B");

    EXPECT_EQ(0u, none.OnAnyChange.Count());
    EXPECT_EQ(1u, reading.GetListeners(VDataPath("A.B")).OnAnyChange.Count());
    EXPECT_EQ(0u, reading.GetListeners(VDataPath("A")).OnAnyChange.Count()) << "a node, no record";
    EXPECT_EQ(0u, reading.GetListeners(VDataPath("A.*")).OnAnyChange.Count());
}

} // namespace
