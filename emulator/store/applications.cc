#include "store/applications.h"

#include "store/database.h"

namespace emulator {

void put_application(database &store, const application &made)
{
    store
        .prepare("INSERT INTO applications (id, key) VALUES (?, ?)"
                 " ON CONFLICT (id) DO UPDATE SET key = excluded.key")
        .bind(made.id, made.key)
        .run();
}

std::optional<std::string> find_application_key(database &store, std::string_view id)
{
    statement query = store.prepare("SELECT key FROM applications WHERE id = ?");
    if (!query.bind(id).step())
        return std::nullopt;
    return query.text(0);
}

} // namespace emulator
