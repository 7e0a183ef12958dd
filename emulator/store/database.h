// SQLite behind owners: a connection, its statements and its transactions.
#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>

#include <sqlite3.h>

namespace emulator {

/** What SQLite refused, in its words. */
class store_error : public std::runtime_error {
public:
    store_error(int code, const std::string &message) : std::runtime_error(message), code_(code) {}
    /** SQLite's extended result code. */
    int code() const { return code_; }

private:
    int code_;
};

/** Bytes that are to be stored as they are, where a plain text would be stored as text. */
struct blob {
    std::string_view bytes;
};

/** A prepared statement. Values are bound in the order of the call, columns count from 0. */
class statement {
public:
    statement(sqlite3 *connection, std::string_view sql);

    /** The bound text must live until the statement has been run. */
    template <class... Values> statement &bind(const Values &...values)
    {
        int index = 0;
        (bind_one(++index, values), ...);
        return *this;
    }

    /** Moves to the next row; false when there is none. */
    bool step();
    /** For statements that yield no rows. */
    void run();

    std::int64_t number(int column) const;
    /** A copy of a text or blob; empty for NULL. */
    std::string text(int column) const;

private:
    struct finalizer {
        void operator()(sqlite3_stmt *handle) const { sqlite3_finalize(handle); }
    };

    void bind_one(int index, std::int64_t value);
    void bind_one(int index, std::string_view value);
    void bind_one(int index, blob value);
    void check(int code) const;

    std::unique_ptr<sqlite3_stmt, finalizer> handle_;
};

class database {
public:
    /** Opens the store, and makes or updates its tables. */
    explicit database(const std::filesystem::path &path);

    /** Runs statements that yield no rows and have nothing to bind. */
    void execute(const std::string &sql);
    statement prepare(std::string_view sql) { return {handle_.get(), sql}; }
    std::int64_t last_row() const { return sqlite3_last_insert_rowid(handle_.get()); }
    /** How many rows the last statement changed. */
    int changed_rows() const { return sqlite3_changes(handle_.get()); }

private:
    struct closer {
        void operator()(sqlite3 *handle) const { sqlite3_close(handle); }
    };

    std::unique_ptr<sqlite3, closer> handle_;
};

enum class transaction_kind { writes, reads };

/** All or nothing: what was not committed by the end of the scope is undone. */
class transaction {
public:
    /** One that writes takes the write lock at once, so that two processes never meet halfway; one
     * that reads sees the store as it was at its first look. */
    explicit transaction(database &in, transaction_kind kind = transaction_kind::writes);
    ~transaction();
    transaction(const transaction &) = delete;
    transaction &operator=(const transaction &) = delete;

    void commit();

private:
    database &database_;
    bool open_ = true;
};

} // namespace emulator
