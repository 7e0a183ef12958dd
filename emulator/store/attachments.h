// Foreign folders: folders of one account that another one has attached. They lie in the root of
// whoever attached them.
#pragma once

#include <cstdint>
#include <vector>

#include "store/folders.h"

namespace emulator {

/** Who sees an entry before and after a change of its place. */
class view_change {
public:
    view_change(std::vector<std::int64_t> before, std::vector<std::int64_t> after)
        : before_(std::move(before)), after_(std::move(after))
    {
    }

    /** These see it afterwards too. */
    void keep(const std::vector<std::int64_t> &accounts);

    std::vector<std::int64_t> lost() const;
    std::vector<std::int64_t> kept() const;
    std::vector<std::int64_t> gained() const;

private:
    std::vector<std::int64_t> before_;
    std::vector<std::int64_t> after_;
};

bool is_attached(database &store, std::int64_t account, std::int64_t folder);
/** Whether the account owns the folder, or has attached it or one above. */
bool sees_folder(database &store, std::int64_t account, std::int64_t folder);
/** Whether any other account has attached the folder or one above. */
bool is_shared(database &store, std::int64_t folder);

/** Throws a refusal when the account has attached it already, or too many today. */
void attach_folder(database &store, std::int64_t account, const folder &foreign, std::int64_t now);
/** Throws a refusal when the account has not attached it. */
void detach_folder(database &store, std::int64_t account, const folder &foreign);

/** How many folders the account attached since the day began. */
std::uint64_t attached_today(database &store, std::int64_t account, std::int64_t now);

} // namespace emulator
