// The account of whoever is signed in, and its tree as the service tells of it.
#pragma once

#include <string>

#include "command.h"
#include "heap.h"
#include "remote_path.h"

namespace quillmere::tools {

struct account {
    service &remote;
    std::string token;

    const char *session() const { return token.c_str(); }
};

/** The account that a command works on; a failure when nobody is signed in. */
account signed_in_account(command_context &context);

/** What the service knows of a folder; of the root when the key is NULL. */
folder_info_owner read_folder(const account &owner, const char *key_or_null);
file_info_owner read_file(const account &owner, const std::string &key);

/** The account's tree, for following paths. It refers to the account. */
remote_tree tree_of(const account &owner);

/** The entry that a path leads to; a failure when there is none, or when it is the root, which can
 * be neither changed nor copied. The verb tells what is to happen to it: "removed". */
remote_entry find_movable(const remote_tree &tree, const std::string &path, const char *verb);

} // namespace quillmere::tools
