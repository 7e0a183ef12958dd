// From the keys in a request to the entries they name, and whether the account may use them so.
#pragma once

#include "service.h"
#include "store/file_entries.h"
#include "store/folders.h"

namespace emulator {

/** Whose eyes to look with: the account's if it sees the folder, or else 0, for what is public. */
std::int64_t viewer_of(const call &asked, std::int64_t folder);

/** A folder to look at: an own or attached one, or any that is public. Without a key the account's
 * root. A deleted one is found by its owner alone. */
folder readable_folder(const call &asked, const char *parameter);
file readable_file(const call &asked, const std::string &key);

/** One that lives and that others see too if they wish: what can be copied. */
folder copyable_folder(const call &asked, const char *parameter);
file copyable_file(const call &asked);

/** One of the account's own, to change it, and no root. */
folder own_folder(const call &asked, const char *parameter);
file own_file(const call &asked, const char *parameter);

/** One of the account's own, to put something in; without a key its root. */
folder destination_folder(const call &asked, const char *parameter);

/** A time that a request gives, or else this one. */
std::int64_t time_given(const call &asked, const char *parameter, std::int64_t otherwise);
/** What a request wants changed. */
metadata_change change_given(const call &asked, const char *name_parameter);

/** "yes" or "no", or this when it is missing or empty. */
bool yes_or_no(const call &asked, const char *parameter, bool otherwise);

/** Every device sees the same tree, but one that sends no proper id has a fault worth finding. */
void check_device_id(const call &asked);

} // namespace emulator
