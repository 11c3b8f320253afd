// Measures the data store beside a map behind a shared mutex and beside LMDB, doing the same work
// in the same run. Standard output gets one JSON object.

#include "BusyWriter.h"
#include "Items.h"
#include "LmdbStore.h"
#include "MapStore.h"
#include "comparison/Comparison.h"

#include "QuorixDataStore/DataListeners.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataWriter.h"

#include <CLI/CLI.hpp>

#include <cstdio>
#include <iostream>
#include <malloc.h>
#include <memory>
#include <optional>
#include <stdexcept>

namespace {

struct VOptions
{
    std::vector<std::size_t> Counts{1000, 100000, 1000000};
    unsigned Rounds = 9;
    std::size_t Operations = 20000; ///< of a sample
    double Seconds = 1;             ///< of a sample beside a busy writer
    std::string Folder = "/dev/shm";
    std::string Only; ///< the one benchmark to run beside loading, or empty for all
};

/// Returns the bytes that are in use on the heap.
double HeapBytes()
{
    const struct mallinfo2 info = mallinfo2();
    return static_cast<double>(info.uordblks) + static_cast<double>(info.hblkhd);
}

void Require(bool condition, const char* what)
{
    if (!condition) {
        throw std::runtime_error(std::string("wrong result: ") + what);
    }
}

/// The three stores of one size, and what is measured on them.
class VRun
{
public:
    VRun(const VOptions& given, std::size_t count)
        : options(given), items(count), map(std::make_unique<VMapStore>()), lmdb(given.Folder)
    {
    }

    nlohmann::json Measure()
    {
        nlohmann::json report;
        report["load"] = Load();
        const auto run = [&](const char* name, const std::function<nlohmann::json()>& measure) {
            if (options.Only.empty() || options.Only == name) {
                report[name] = measure();
            }
        };
        run("read_1_per_scope", [this] { return ReadOne(); });
        run("read_100_per_scope", [this] { return ReadHundred(); });
        run("find_50_of_a_device", [this] { return FindDevice(); });
        run("commit_1000", [this] { return CommitThousand(); });
        run("commit_1_with_listener", [this] { return CommitOne(); });
        for (const std::size_t perScope : {1, 1000}) {
            const std::string name = "read_beside_writer_of_" + std::to_string(perScope);
            run(name.c_str(), [&] {
                return CompareBesideBusyWriter(items, store, *map, perScope, options.Seconds);
            });
        }
        return report;
    }

private:
    /// Loads each store from nothing, and counts the memory that it takes.
    nlohmann::json Load()
    {
        const VDataValue value = MakeNumber(0);
        const std::size_t count = items.Texts.size();
        double before = HeapBytes();
        const double own = ProcessorSecondsOf([&] {
            VDataWriter writer(store);
            for (const std::string& text : items.Texts) {
                // A token of its own, as a loader makes it; what a token holds is not the store's.
                Require(writer.SetValue(VDataToken(VDataPath(text)), value), "load");
            }
        });
        const double ownBytes = HeapBytes() - before;
        before = HeapBytes();
        const double limit = ProcessorSecondsOf([&] {
            map->Write([&](const auto& set) {
                for (const std::string& text : items.Texts) {
                    set(text, value);
                }
            });
        });
        const double limitBytes = HeapBytes() - before;
        const double second = ProcessorSecondsOf([&] {
            lmdb.BeginWrite();
            for (const std::string& text : items.Texts) {
                lmdb.Put(text, value);
            }
            lmdb.CommitWrite();
        });
        {
            const VDataReader reader(store);
            for (const VDataToken& token : items.Tokens) {
                Require(reader.GetValue(token) == value, "loaded value");
            }
        }
        const auto perItem = static_cast<double>(count);
        return {{"own_ns_per_item", own * 1e9 / perItem},
                {"limit_ns_per_item", limit * 1e9 / perItem},
                {"lmdb_ns_per_item", second * 1e9 / perItem},
                {"ratio", own / limit},
                {"own_heap_bytes_per_item", ownBytes / perItem},
                {"limit_heap_bytes_per_item", limitBytes / perItem},
                {"aim_heap_bytes_per_item", 515},
                {"aim_met", ownBytes / perItem <= 515}};
    }

    nlohmann::json ReadOne()
    {
        VDataValue seen;
        const auto own = [&] {
            for (std::size_t index = 0; index < options.Operations; ++index) {
                const VDataReader reader(store);
                reader.GetValue(items.Tokens[items.Next()], seen);
            }
        };
        const auto limit = [&] {
            for (std::size_t index = 0; index < options.Operations; ++index) {
                map->Read([&](const auto& values) {
                    seen = values.find(items.Texts[items.Next()])->second;
                });
            }
        };
        const auto second = [&] {
            for (std::size_t index = 0; index < options.Operations; ++index) {
                lmdb.BeginRead();
                Require(lmdb.Get(items.Texts[items.Next()], seen), "read");
                lmdb.EndRead();
            }
        };
        return WithSecond(own, limit, second, items.Texts.size() < 100000 ? 1.0 : 0.6,
                          std::nullopt);
    }

    nlohmann::json ReadHundred()
    {
        VDataValue seen;
        const std::size_t scopes = options.Operations / 100;
        const auto own = [&] {
            for (std::size_t scope = 0; scope < scopes; ++scope) {
                const VDataReader reader(store);
                for (int index = 0; index < 100; ++index) {
                    reader.GetValue(items.Tokens[items.Next()], seen);
                }
            }
        };
        const auto limit = [&] {
            for (std::size_t scope = 0; scope < scopes; ++scope) {
                map->Read([&](const auto& values) {
                    for (int index = 0; index < 100; ++index) {
                        seen = values.find(items.Texts[items.Next()])->second;
                    }
                });
            }
        };
        const auto second = [&] {
            for (std::size_t scope = 0; scope < scopes; ++scope) {
                lmdb.BeginRead();
                for (int index = 0; index < 100; ++index) {
                    Require(lmdb.Get(items.Texts[items.Next()], seen), "read");
                }
                lmdb.EndRead();
            }
        };
        return WithSecond(own, limit, second,
                          items.Texts.size() < 100000 ? std::nullopt : std::optional<double>(0.5),
                          std::nullopt);
    }

    nlohmann::json CommitOne()
    {
        // The listener is on one path, which every scope writes.
        const std::size_t position = items.Random[0];
        std::size_t heard = 0;
        std::uint64_t handle = 0;
        {
            VDataWriter writer(store);
            handle = writer.GetListeners(items.Tokens[position]).OnVerifiedChanged.Add([&heard] {
                ++heard;
            });
        }
        map->Listen(items.Texts[position], [&heard] { ++heard; });
        double number = 1;
        const std::size_t operations = options.Operations;
        const auto own = [&] {
            for (std::size_t index = 0; index < operations; ++index) {
                const VDataValue value = MakeNumber(++number);
                VDataWriter writer(store);
                writer.SetValue(items.Tokens[position], value);
            }
        };
        const auto limit = [&] {
            for (std::size_t index = 0; index < operations; ++index) {
                const VDataValue value = MakeNumber(++number);
                map->Write([&](const auto& set) { set(items.Texts[position], value); });
            }
        };
        const auto second = [&] {
            for (std::size_t index = 0; index < operations; ++index) {
                const VDataValue value = MakeNumber(++number);
                lmdb.BeginWrite();
                lmdb.Put(items.Texts[position], value);
                lmdb.CommitWrite();
                ++heard;
            }
        };
        nlohmann::json result = WithSecond(own, limit, second, 3.0, 0.10);
        Require(heard == 3 * operations * (options.Rounds + 1) + operations * (options.Rounds + 1),
                "calls of the listener");
        {
            VDataWriter writer(store);
            writer.GetListeners(items.Tokens[position]).OnVerifiedChanged.Remove(handle);
        }
        map->StopListening();
        return result;
    }

    nlohmann::json CommitThousand()
    {
        double number = 1;
        const std::size_t scopes = std::max<std::size_t>(1, options.Operations / 1000);
        const auto own = [&] {
            for (std::size_t scope = 0; scope < scopes; ++scope) {
                const VDataValue value = MakeNumber(++number);
                VDataWriter writer(store);
                for (int index = 0; index < 1000; ++index) {
                    writer.SetValue(items.Tokens[items.Next()], value);
                }
            }
        };
        const auto limit = [&] {
            for (std::size_t scope = 0; scope < scopes; ++scope) {
                const VDataValue value = MakeNumber(++number);
                map->Write([&](const auto& set) {
                    for (int index = 0; index < 1000; ++index) {
                        set(items.Texts[items.Next()], value);
                    }
                });
            }
        };
        const auto second = [&] {
            for (std::size_t scope = 0; scope < scopes; ++scope) {
                const VDataValue value = MakeNumber(++number);
                lmdb.BeginWrite();
                for (int index = 0; index < 1000; ++index) {
                    lmdb.Put(items.Texts[items.Next()], value);
                }
                lmdb.CommitWrite();
            }
        };
        return WithSecond(own, limit, second, 0.6, std::nullopt);
    }

    nlohmann::json FindDevice()
    {
        const std::size_t devices = items.Texts.size() / itemsPerDevice;
        std::vector<VDataPath> paths;
        std::vector<std::string> prefixes;
        for (std::size_t index = 0; index < 1000; ++index) {
            const std::string device =
                "qx:" + std::to_string(items.Random[index % items.Random.size()] % devices);
            paths.push_back(VDataPath{"Device", device, "*"});
            prefixes.push_back("Device." + device + ".");
        }
        const std::size_t scopes = std::max<std::size_t>(1, options.Operations / itemsPerDevice);
        const auto own = [&] {
            std::vector<VDataToken> tokens;
            for (std::size_t scope = 0; scope < scopes; ++scope) {
                const VDataReader reader(store);
                reader.FindTokens(paths[scope % paths.size()], tokens);
                Require(tokens.size() == itemsPerDevice, "items of a device");
            }
        };
        const auto limit = [&] {
            std::vector<std::string> found;
            for (std::size_t scope = 0; scope < scopes; ++scope) {
                const std::string& prefix = prefixes[scope % prefixes.size()];
                found.clear();
                map->Read([&](const auto& values) {
                    for (auto at = values.lower_bound(prefix);
                         at != values.end() && at->first.compare(0, prefix.size(), prefix) == 0;
                         ++at) {
                        found.push_back(at->first);
                    }
                });
                Require(found.size() == itemsPerDevice, "items of a device in the map");
            }
        };
        return Compare(options.Rounds, static_cast<double>(scopes), own, limit, 0.9);
    }

    /// Compares with the map, and then with LMDB.
    nlohmann::json WithSecond(const std::function<void()>& own, const std::function<void()>& limit,
                              const std::function<void()>& second, std::optional<double> aim,
                              std::optional<double> secondAim)
    {
        const auto operations = static_cast<double>(options.Operations);
        nlohmann::json result = Compare(options.Rounds, operations, own, limit, aim);
        result["beside_lmdb"] = Compare(options.Rounds, operations, own, second, secondAim);
        return result;
    }

    const VOptions& options;
    VItems items;
    VDataStore store;
    std::unique_ptr<VMapStore> map;
    VLmdbStore lmdb;
};

} // namespace

int main(int argc, char** argv)
{
    VOptions options;
    CLI::App app("Measures the data store beside a map behind a shared mutex and beside LMDB.");
    app.add_option("--count", options.Counts, "items, one run for each");
    app.add_option("--rounds", options.Rounds, "samples of each side")->check(CLI::PositiveNumber);
    app.add_option("--operations", options.Operations, "operations of a sample")
        ->check(CLI::Range(1000, 100000000));
    app.add_option("--seconds", options.Seconds, "length of a sample beside a busy writer");
    app.add_option("--folder", options.Folder, "where LMDB's files are, a file system in memory");
    app.add_option("--only", options.Only, "name of one benchmark to run, beside loading");
    CLI11_PARSE(app, argc, argv);

    try {
        nlohmann::json report;
        for (const std::size_t count : options.Counts) {
            report[std::to_string(count)] = VRun(options, count).Measure();
        }
        std::cout << report.dump(2) << std::endl;
    } catch (const std::exception& error) {
        std::fprintf(stderr, "benchmark_data_store: %s\n", error.what());
        return 1;
    }
    return 0;
}
