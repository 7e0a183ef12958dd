#include "store/database.h"

#include "store/schema.h"

namespace emulator {
namespace {

constexpr int busy_timeout_milliseconds = 5000;

[[noreturn]] void fail(sqlite3 *connection)
{
    throw store_error(sqlite3_extended_errcode(connection),
                      std::string("store: ") + sqlite3_errmsg(connection));
}

} // namespace

statement::statement(sqlite3 *connection, std::string_view sql)
{
    sqlite3_stmt *handle = nullptr;
    const int code =
        sqlite3_prepare_v2(connection, sql.data(), static_cast<int>(sql.size()), &handle, nullptr);
    handle_.reset(handle);
    if (code != SQLITE_OK)
        fail(connection);
}

bool statement::step()
{
    const int code = sqlite3_step(handle_.get());
    if (code == SQLITE_ROW)
        return true;
    if (code != SQLITE_DONE)
        fail(sqlite3_db_handle(handle_.get()));
    return false;
}

void statement::run()
{
    if (step())
        throw std::logic_error("a statement yielded a row that nobody reads");
}

std::int64_t statement::number(int column) const
{
    return sqlite3_column_int64(handle_.get(), column);
}

std::string statement::text(int column) const
{
    const void *bytes = sqlite3_column_blob(handle_.get(), column);
    const int length = sqlite3_column_bytes(handle_.get(), column);
    return bytes ? std::string(static_cast<const char *>(bytes), static_cast<std::size_t>(length))
                 : std::string();
}

void statement::bind_one(int index, std::int64_t value)
{
    check(sqlite3_bind_int64(handle_.get(), index, value));
}

void statement::bind_one(int index, std::string_view value)
{
    // An empty view may have a null pointer, which SQLite would take for NULL.
    const char *bytes = value.data() ? value.data() : "";
    check(
        sqlite3_bind_text64(handle_.get(), index, bytes, value.size(), SQLITE_STATIC, SQLITE_UTF8));
}

void statement::bind_one(int index, blob value)
{
    check(sqlite3_bind_blob64(handle_.get(), index, value.bytes.data(), value.bytes.size(),
                              SQLITE_STATIC));
}

void statement::check(int code) const
{
    if (code != SQLITE_OK)
        fail(sqlite3_db_handle(handle_.get()));
}

database::database(const std::filesystem::path &path)
{
    sqlite3 *handle = nullptr;
    const int code = sqlite3_open_v2(path.c_str(), &handle,
                                     SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE |
                                         SQLITE_OPEN_NOMUTEX | SQLITE_OPEN_EXRESCODE,
                                     nullptr);
    handle_.reset(handle);
    if (code != SQLITE_OK)
        fail(handle);
    sqlite3_busy_timeout(handle, busy_timeout_milliseconds);
    // FULL: an answer to the client must mean that the change is on the disk, log included.
    execute("PRAGMA journal_mode = WAL; PRAGMA synchronous = FULL; PRAGMA foreign_keys = ON;");
    bring_up_to_date(*this);
}

void database::execute(const std::string &sql)
{
    if (sqlite3_exec(handle_.get(), sql.c_str(), nullptr, nullptr, nullptr) != SQLITE_OK)
        fail(handle_.get());
}

transaction::transaction(database &in, transaction_kind kind) : database_(in)
{
    database_.execute(kind == transaction_kind::writes ? "BEGIN IMMEDIATE" : "BEGIN");
}

transaction::~transaction()
{
    if (!open_)
        return;
    try {
        database_.execute("ROLLBACK");
    } catch (const store_error &) {
        // SQLite has rolled back already, after an error of its own such as a full disk.
    }
}

void transaction::commit()
{
    database_.execute("COMMIT");
    open_ = false;
}

} // namespace emulator
