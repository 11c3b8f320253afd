#pragma once

#include "io/DataValue.h"

#include <lmdb.h>

#include <string>

/// A store of LMDB in a folder in memory, with MDB_NOSYNC, as a second limit.
///
/// Failure: every operation throws `std::runtime_error` with LMDB's text.
class VLmdbStore
{
public:
    /// @param folder  a file system in memory; a folder is made in it and removed at the end
    explicit VLmdbStore(const std::string& folder);
    ~VLmdbStore();

    VLmdbStore(const VLmdbStore&) = delete;
    VLmdbStore& operator=(const VLmdbStore&) = delete;

    void BeginWrite();
    void Put(const std::string& path, const VDataValue& value);
    void CommitWrite();

    void BeginRead();
    bool Get(const std::string& path, VDataValue& value);
    void EndRead();

private:
    std::string folder;
    MDB_env* environment = nullptr;
    MDB_dbi table = 0;
    MDB_txn* writing = nullptr;
    MDB_txn* reading = nullptr;
};
