#include "LmdbStore.h"

#include <cstdlib>
#include <stdexcept>
#include <unistd.h>

namespace {

constexpr std::size_t mapSize = std::size_t(2) << 30;

void Check(int result)
{
    if (result != MDB_SUCCESS) {
        throw std::runtime_error(mdb_strerror(result));
    }
}

MDB_val TextOf(const std::string& text)
{
    return {text.size(), const_cast<char*>(text.data())};
}

} // namespace

VLmdbStore::VLmdbStore(const std::string& parent) : folder(parent + "/quorix-benchmark-XXXXXX")
{
    if (mkdtemp(folder.data()) == nullptr) {
        throw std::runtime_error("cannot make a folder in " + parent);
    }
    Check(mdb_env_create(&environment));
    Check(mdb_env_set_mapsize(environment, mapSize));
    Check(mdb_env_open(environment, folder.c_str(), MDB_NOSYNC, 0600));
    BeginWrite();
    Check(mdb_dbi_open(writing, nullptr, 0, &table));
    CommitWrite();
    Check(mdb_txn_begin(environment, nullptr, MDB_RDONLY, &reading));
    mdb_txn_reset(reading);
}

VLmdbStore::~VLmdbStore()
{
    mdb_txn_abort(reading);
    mdb_env_close(environment);
    unlink((folder + "/data.mdb").c_str());
    unlink((folder + "/lock.mdb").c_str());
    rmdir(folder.c_str());
}

void VLmdbStore::BeginWrite()
{
    Check(mdb_txn_begin(environment, nullptr, 0, &writing));
}

void VLmdbStore::Put(const std::string& path, const VDataValue& value)
{
    MDB_val key = TextOf(path);
    MDB_val data{value.Bytes.size(), const_cast<unsigned char*>(value.Bytes.data())};
    Check(mdb_put(writing, table, &key, &data, 0));
}

void VLmdbStore::CommitWrite()
{
    Check(mdb_txn_commit(writing));
    writing = nullptr;
}

void VLmdbStore::BeginRead()
{
    Check(mdb_txn_renew(reading));
}

bool VLmdbStore::Get(const std::string& path, VDataValue& value)
{
    MDB_val key = TextOf(path);
    MDB_val data{};
    if (mdb_get(reading, table, &key, &data) != MDB_SUCCESS) {
        return false;
    }
    const auto* bytes = static_cast<const unsigned char*>(data.mv_data);
    value.Bytes.assign(bytes, bytes + data.mv_size);
    return true;
}

void VLmdbStore::EndRead()
{
    mdb_txn_reset(reading);
}
