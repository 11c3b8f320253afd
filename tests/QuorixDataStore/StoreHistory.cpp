#include "StoreHistory.h"

#include "StoreFixture.h"

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <stdexcept>
#include <thread>

namespace StoreTest {

namespace {

const KVR::IO::ISchema* SchemaOf(int index)
{
    static const KVR::IO::ISchema* const named = [] {
        KVR::IO::ISchema schema = KVR::IO::GetUniquePodSchema(KVR::IO::EType::UInt8);
        schema.TypeName = "Percentage";
        return &KVR::IO::GetUniqueSchema(schema);
    }();
    switch (index) {
    case 0:
        return &KVR::IO::GetUniquePodSchema(KVR::IO::EType::UInt8);
    case 1:
        return &KVR::IO::GetUniquePodSchema(KVR::IO::EType::UInt16);
    default:
        return named;
    }
}

VDataValue RealValue(const VReferenceValue& value)
{
    const auto byte = static_cast<unsigned char>(value.Number);
    return {SchemaOf(value.Schema), value.Schema == 1 ? std::vector<unsigned char>{byte, 0}
                                                      : std::vector<unsigned char>{byte}};
}

std::string SchemaText(const KVR::IO::ISchema* schema)
{
    for (int index = 0; index < 3; ++index) {
        if (schema == SchemaOf(index)) {
            return std::to_string(index);
        }
    }
    return "untouched";
}

std::string Result(bool result, const std::string& rest = std::string())
{
    return (result ? "true " : "false ") + rest;
}

VDataPath RealPath(const Names& names)
{
    return VDataPath(names);
}

Names NamesOf(const VDataPath& path)
{
    Names names;
    for (std::size_t index = 0; index < path.Count(); ++index) {
        names.emplace_back(path.Component(index));
    }
    return names;
}

template <typename Choices>
const auto& Pick(std::mt19937& random, const Choices& choices)
{
    return choices[random() % choices.size()];
}

Names RandomPath(std::mt19937& random, bool wildcards)
{
    static const std::vector<std::string> names{"A", "B", "C"};
    // Rules about one item need several steps on it within a scope.
    static const std::vector<Names> busyItems{{"A"}, {"A", "B"}};
    if (!wildcards && random() % 2 == 0) {
        return Pick(random, busyItems);
    }
    Names path;
    const std::size_t count = random() % 20 == 0 ? 0 : 1 + random() % 3;
    for (std::size_t index = 0; index < count; ++index) {
        const bool wild = wildcards && random() % 3 == 0;
        path.push_back(wild ? "*" : Pick(random, names));
    }
    return path;
}

/// Returns a store that no history is about, in which other items have the numbers.
const VDataStore& Elsewhere()
{
    static const std::unique_ptr<VDataStore> store = [] {
        auto made = std::make_unique<VDataStore>();
        VDataWriter writer(*made);
        for (const char* path : {"C.C", "B", "C", "A.B", "B.A.C", "C.A"}) {
            EXPECT_TRUE(writer.SetValue(Token(path), Byte(77)));
        }
        return made;
    }();
    return *store;
}

/// A listener that fails: nobody else may notice.
void Throw()
{
    throw std::runtime_error("a listener of a history");
}

std::vector<std::string>& FiringsOfThisThread()
{
    static thread_local std::vector<std::string> firings;
    return firings;
}

} // namespace

const std::vector<Names>& HistoryListeners()
{
    static const std::vector<Names> listeners{{"A"},
                                              {"A", "B"},
                                              {"A", "*"},
                                              {"*", "B"},
                                              {"*"},
                                              {"A", "*", "C"},
                                              {"*", "*"},
                                              {"B", "A", "C"},
                                              {"A", "B", "*"},
                                              {"C", "*", "*"},
                                              {"*", "B", "*"},
                                              {"*", "*", "*"},
                                              {"C"}};
    return listeners;
}

VStoreStep RandomStep(std::mt19937& random, bool writing)
{
    VStoreStep step;
    const bool write = writing && random() % 3 != 0;
    const unsigned first = write ? VStoreStep::FirstWrite : 0;
    const unsigned end = write ? VStoreStep::KindCount : VStoreStep::FirstWrite;
    step.Kind = static_cast<VStoreStep::EKind>(first + random() % (end - first));
    if (write && random() % 2 == 0) {
        step.Kind = VStoreStep::SetValue;
    }
    const bool byPath =
        step.Kind == VStoreStep::FindTokens || step.Kind == VStoreStep::GetChildCount ||
        step.Kind == VStoreStep::GetChildren || step.Kind == VStoreStep::HasChild ||
        step.Kind == VStoreStep::GetPathChangeId || step.Kind == VStoreStep::SetValues ||
        step.Kind == VStoreStep::RemoveAll || step.Kind == VStoreStep::RemoveAllRestorable;
    step.Path = RandomPath(random, byPath || random() % 30 == 0);
    step.Name = std::string(1, static_cast<char>('A' + random() % 4));
    step.Value.Schema = random() % 4 != 0 ? 0 : static_cast<int>(random() % 3);
    step.Value.Number = static_cast<int>(random() % 3);
    step.Target = random() % 12 == 0 ? 7 : 1 + random() % 3;
    step.Flags = random() % 4;
    step.Token = static_cast<VStoreStep::EToken>(random() % 3);
    step.Elsewhere = random() % 4 == 0;
    return step;
}

VSharedTokens::VSharedTokens()
{
    std::vector<Names> parents{Names()};
    for (int depth = 0; depth < 3; ++depth) {
        std::vector<Names> children;
        for (const Names& parent : parents) {
            for (const char* name : {"A", "B", "C"}) {
                children.push_back(parent);
                children.back().emplace_back(name);
                tokens.emplace(children.back(), VDataToken(RealPath(children.back())));
            }
        }
        parents = std::move(children);
    }
}

const VDataToken* VSharedTokens::Find(const Names& path) const
{
    const auto found = tokens.find(path);
    return found == tokens.end() ? nullptr : &found->second;
}

const VDataToken& VStepPerformer::TokenOf(const VStoreStep& step, const VDataToken& fresh)
{
    if (step.Token == VStoreStep::Kept) {
        return kept.emplace(step.Path, fresh).first->second;
    }
    const VDataToken* common = step.Token == VStoreStep::Shared ? shared.Find(step.Path) : nullptr;
    return common != nullptr ? *common : fresh;
}

std::string VStepPerformer::Perform(const VStoreStep& step)
{
    const VDataPath path = RealPath(step.Path);
    const VDataToken fresh(path);
    const VDataToken& token = TokenOf(step, fresh);
    if (step.Elsewhere) {
        static_cast<void>(VDataReader(Elsewhere()).HasValue(token)); // leaves its numbers there
    }
    const auto target = static_cast<EDataValueTarget>(step.Target);
    std::string text;
    switch (step.Kind) {
    case VStoreStep::FindTokens: {
        std::vector<VDataToken> tokens;
        const bool result = store.FindTokens(path, tokens);
        for (const VDataToken& found : tokens) {
            text += found.GetPath().Text() + ",";
            kept[NamesOf(found.GetPath())] = found;
        }
        return Result(result, text);
    }
    case VStoreStep::GetChildCount:
        return std::to_string(store.GetChildCount(path));
    case VStoreStep::HasChild:
        return Result(store.HasChild(path, step.Name));
    case VStoreStep::GetChildren: {
        std::vector<std::string> names;
        const bool result = store.GetChildren(path, names);
        for (const std::string& name : names) {
            text += name + ",";
        }
        return Result(result, text);
    }
    case VStoreStep::HasValue:
        return Result(store.HasValue(token));
    case VStoreStep::GetValue: {
        VDataValue value;
        const bool result = store.GetValue(token, value, target);
        return Result(result,
                      result ? SchemaText(value.Schema) + ":" + std::to_string(value.Bytes.at(0))
                             : "none");
    }
    case VStoreStep::GetSchema: {
        const KVR::IO::ISchema* schema = nullptr;
        const bool result = store.GetSchema(token, schema);
        return Result(result, SchemaText(schema));
    }
    case VStoreStep::GetFlags: {
        std::uint32_t flags = 99;
        const bool result = store.GetFlags(token, flags);
        return Result(result, std::to_string(flags));
    }
    case VStoreStep::GetPathChangeId: {
        std::uint64_t id = 0;
        const bool result = store.GetPathChangeId(path, id);
        return Result(result, result ? std::to_string(id) : "untouched");
    }
    case VStoreStep::GetItemChangeId: {
        std::uint64_t id = 0;
        const bool result = store.GetItemChangeId(token, id);
        return Result(result, result ? std::to_string(id) : "untouched");
    }
    case VStoreStep::SetValue:
        return Result(store.SetValue(token, RealValue(step.Value), target));
    case VStoreStep::SetValues:
        return Result(store.SetValues(path, RealValue(step.Value), target));
    case VStoreStep::Remove:
        return Result(store.Remove(token, false));
    case VStoreStep::RemoveRestorable:
        return Result(store.Remove(token, true));
    case VStoreStep::RemoveAll:
        return Result(store.RemoveAll(path));
    case VStoreStep::RemoveAllRestorable:
        return Result(store.RemoveAllRestorable(path));
    case VStoreStep::SetFlags:
        return Result(store.SetFlags(token, step.Flags));
    default:
        return std::to_string(store.GetCurrentChangeId());
    }
}

void VFiringRecorder::ListenTo(VDataStore& store)
{
    std::uint64_t changeId = 0;
    store.AcquireWriteLock(changeId);
    bool throws = false;
    for (const Names& path : HistoryListeners()) {
        VDataListeners& listeners = store.GetListeners(RealPath(path));
        const auto note = [name = Join(path)](const char* kind) {
            return [line = kind + name] { FiringsOfThisThread().push_back(line); };
        };
        listeners.OnRemoved.Add(note("removed "));
        listeners.OnProposalPending.Add(note("pending "));
        listeners.OnVerifiedChanged.Add(note("verified "));
        listeners.OnFlagsChanged.Add(note("flags "));
        listeners.OnAnyChange.Add(note("any "));
        throws = !throws;
        if (throws) {
            for (auto* callback :
                 {&listeners.OnRemoved, &listeners.OnProposalPending, &listeners.OnVerifiedChanged,
                  &listeners.OnFlagsChanged, &listeners.OnAnyChange}) {
                callback->Add(&Throw);
            }
        }
    }
    store.ReleaseWriteLock();
}

std::vector<std::string> VFiringRecorder::Take()
{
    std::vector<std::string> firings = std::move(FiringsOfThisThread());
    FiringsOfThisThread().clear();
    const auto kind = [](const std::string& line) { return line.substr(0, line.find(' ')); };
    for (auto begin = firings.begin(); begin != firings.end();) {
        const auto end = std::find_if(begin, firings.end(), [&](const std::string& line) {
            return kind(line) != kind(*begin);
        });
        std::sort(begin, end);
        begin = end;
    }
    return firings;
}

std::string LocksText(const VDataStore& store)
{
    std::string text;
    for (const VDataStoreLock& lock : store.GetLocks()) {
        text += "  " + lock.ThreadName + " change id " + std::to_string(lock.ChangeId) + " reads " +
                std::to_string(lock.ReadLocks) + " writes " + std::to_string(lock.WriteLocks) +
                (lock.Waiting ? " waiting" : "") + (lock.WriterMark ? " writer" : "") + "\n";
    }
    return text;
}

struct VWatchdog::VState
{
    std::mutex Mutex;
    std::condition_variable Changed;
    bool Done = false;
    std::thread Thread;
};

VWatchdog::VWatchdog(const VDataStore& store, std::string label) : state(new VState)
{
    state->Thread = std::thread([this, &store, label = std::move(label)] {
        std::unique_lock<std::mutex> lock(state->Mutex);
        if (!state->Changed.wait_for(lock, std::chrono::seconds(60),
                                     [this] { return state->Done; })) {
            std::fprintf(stderr, "Stalled: %s\n%s", label.c_str(), LocksText(store).c_str());
            std::abort();
        }
    });
}

VWatchdog::~VWatchdog()
{
    {
        const std::lock_guard<std::mutex> lock(state->Mutex);
        state->Done = true;
    }
    state->Changed.notify_all();
    state->Thread.join();
    delete state;
}

std::vector<std::uint32_t> HistorySeeds(std::uint32_t count)
{
    if (const char* seed = std::getenv("QUORIX_SEED")) {
        return {static_cast<std::uint32_t>(std::strtoul(seed, nullptr, 10))};
    }
    const char* soak = std::getenv("QUORIX_SOAK");
    if (soak != nullptr && std::string(soak) == "1") {
        count *= 20;
    }
    std::vector<std::uint32_t> seeds;
    for (std::uint32_t seed = 1; seed <= count; ++seed) {
        seeds.push_back(seed);
    }
    return seeds;
}

} // namespace StoreTest
