// What a mirror keeps from one run to the next: what it knows of the account, and what it has put
// into the copy.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "known_account.h"
#include "placement.h"

namespace quillmere::tools {

struct mirror_state {
    known_account account;
    placements here;
};

/** The state as a text, and back; a failure for a text that is none. */
std::string text_of(const mirror_state &state);
mirror_state state_in(std::string_view text);

/** Reads the state's file in an open folder; nothing when there is none. */
std::optional<mirror_state> load_state(int folder);

/** Replaces it. After a crash the old one is there or the new one, never a part. */
void save_state(int folder, const mirror_state &state);

} // namespace quillmere::tools
