#include "Measurements.h"

#include "AllocationCounts.h"
#include "DeviceConnection.h"
#include "HostProcess.h"

#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>

namespace ControlStreamBenchmark {

namespace {

constexpr std::size_t idleConnections = 1000;
constexpr int countedRequests = 2000;
constexpr int countedConnections = 500;

using VConnections = std::vector<VDeviceConnection>;

/// The page of counts that the counted host writes.
class VSharedCounts
{
public:
    VSharedCounts() : descriptor(memfd_create("allocation counts", 0)) // kept open over exec
    {
        void* page = MAP_FAILED;
        if (descriptor >= 0 && ftruncate(descriptor, sizeof(VAllocationCounts)) == 0) {
            page = mmap(nullptr, sizeof(VAllocationCounts), PROT_READ | PROT_WRITE, MAP_SHARED,
                        descriptor, 0);
        }
        if (page == MAP_FAILED) {
            throw std::system_error(errno, std::generic_category(), "memfd_create");
        }
        counts = static_cast<VAllocationCounts*>(page);
    }

    VSharedCounts(const VSharedCounts&) = delete;
    VSharedCounts& operator=(const VSharedCounts&) = delete;

    ~VSharedCounts()
    {
        munmap(counts, sizeof(VAllocationCounts));
        close(descriptor);
    }

    std::string Variable() const
    {
        return allocationCountsVariable + ("=" + std::to_string(descriptor));
    }
    const VAllocationCounts& Counts() const { return *counts; }

private:
    int descriptor;
    VAllocationCounts* counts = nullptr;
};

/// Returns once the host has accepted every connection made so far: it accepts them in their order.
void AwaitAccepted(const IServer& host)
{
    VDeviceConnection(host.Port()).Ask(ServerInformationFrame());
}

VConnections Connect(const IServer& host)
{
    VConnections connections;
    connections.reserve(idleConnections);
    for (std::size_t index = 0; index < idleConnections; ++index) {
        connections.emplace_back(host.Port());
    }
    AwaitAccepted(host);
    return connections;
}

void Serve(VConnections& connections, const std::string& reply)
{
    for (VDeviceConnection& connection : connections) {
        connection.Exchange(ExecuteCommandFrame(), reply);
    }
}

template <typename VValue>
double PerConnection(VValue after, VValue before)
{
    return static_cast<double>(after - before) / static_cast<double>(idleConnections);
}

/// What the kernel tells: pages, which a heap takes and keeps in larger pieces.
nlohmann::ordered_json MeasurePages(const std::string& program)
{
    const VHostProcess host(program);
    const std::string reply = VDeviceConnection(host.Port()).Ask(ExecuteCommandFrame());
    nlohmann::ordered_json result;
    result["host_resident_bytes"] = MemoryBytes(host.Process(), "Rss");
    const std::int64_t before = MemoryBytes(host.Process(), "Anonymous");
    VConnections connections = Connect(host);
    result["anonymous_bytes_per_idle_connection"] =
        PerConnection(MemoryBytes(host.Process(), "Anonymous"), before);
    Serve(connections, reply);
    result["anonymous_bytes_per_served_connection"] =
        PerConnection(MemoryBytes(host.Process(), "Anonymous"), before);
    return result;
}

void AddConnectionCounts(nlohmann::ordered_json& result, const IServer& host,
                         const VAllocationCounts& counts, const std::string& reply)
{
    const std::int64_t before = counts.LiveBytes;
    {
        VConnections connections = Connect(host);
        result["heap_bytes_per_idle_connection"] = PerConnection(counts.LiveBytes.load(), before);
        result["aims"]["heap_bytes_per_idle_connection"] = {
            {"at_most", 8192},
            {"reached", result["heap_bytes_per_idle_connection"].get<double>() < 8192}};
        Serve(connections, reply);
        result["heap_bytes_per_served_connection"] = PerConnection(counts.LiveBytes.load(), before);
    }
    // The host drops what it knows of a dead connection when the next one comes; the second comes
    // after the first has been dropped too.
    AwaitAccepted(host);
    AwaitAccepted(host);
    result["heap_bytes_kept_after_all_closed"] = counts.LiveBytes - before;
}

void AddRequestCounts(nlohmann::ordered_json& result, const IServer& host,
                      const VAllocationCounts& counts, const std::string& reply)
{
    VDeviceConnection device(host.Port());
    device.Exchange(ExecuteCommandFrame(), reply);
    const std::int64_t allocations = counts.Allocations;
    const std::int64_t bytes = counts.AllocatedBytes;
    for (int request = 0; request < countedRequests; ++request) {
        device.Exchange(ExecuteCommandFrame(), reply);
    }
    result["allocations_per_request"] =
        static_cast<double>(counts.Allocations - allocations) / countedRequests;
    result["allocated_bytes_per_request"] =
        static_cast<double>(counts.AllocatedBytes - bytes) / countedRequests;
}

void AddTurnCounts(nlohmann::ordered_json& result, const IServer& host,
                   const VAllocationCounts& counts, const std::string& reply)
{
    const std::int64_t allocations = counts.Allocations;
    for (int turn = 0; turn < countedConnections; ++turn) {
        VDeviceConnection(host.Port()).Exchange(ExecuteCommandFrame(), reply);
    }
    result["allocations_per_connect_request_close"] =
        static_cast<double>(counts.Allocations - allocations) / countedConnections;
}

} // namespace

nlohmann::ordered_json MeasureMemory(const std::string& program, const std::string& counter)
{
    nlohmann::ordered_json result = MeasurePages(program);
    if (counter.empty()) {
        return result;
    }
    const VSharedCounts shared;
    const VHostProcess host(program, {"LD_PRELOAD=" + counter, shared.Variable()});
    const std::string reply = VDeviceConnection(host.Port()).Ask(ExecuteCommandFrame());
    if (shared.Counts().Allocations == 0) {
        throw std::runtime_error("the allocation counter was not loaded into the host");
    }
    AddConnectionCounts(result, host, shared.Counts(), reply);
    AddRequestCounts(result, host, shared.Counts(), reply);
    AddTurnCounts(result, host, shared.Counts(), reply);
    return result;
}

} // namespace ControlStreamBenchmark
