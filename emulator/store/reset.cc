#include "store/reset.h"

#include <set>
#include <string>

#include "store/content.h"
#include "store/database.h"

namespace emulator {
namespace {

void empty_trees(database &store)
{
    transaction change(store);
    // A parent may go ahead of what it holds: at the end of the transaction all of it is gone.
    store.execute("PRAGMA defer_foreign_keys = ON;"
                  "DELETE FROM one_time_links; DELETE FROM attachments; DELETE FROM feed;"
                  "DELETE FROM files; DELETE FROM folders WHERE parent IS NOT NULL;"
                  "UPDATE accounts SET revision = 1, epoch = epoch + 1, bandwidth_used = 0,"
                  " use_day = 0, streamed_today = 0, one_time_today = 0;");
    change.commit();
}

// Only when no file refers to them any more, so that a kill at any moment leaves none without its
// bytes; and under the lock, since somebody may be putting new ones in.
void drop_unused_content(database &store, content_store &content)
{
    const transaction change(store);
    std::set<std::string> used;
    statement query = store.prepare("SELECT DISTINCT hash FROM files");
    while (query.step())
        used.insert(query.text(0));
    content.keep_only(used);
}

} // namespace

void reset_trees(database &store, content_store &content)
{
    empty_trees(store);
    drop_unused_content(store, content);
}

} // namespace emulator
