// What a command line said, before anything is made of it.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace quillmere::tools {

/** The options that every command has. */
struct common_arguments {
    std::optional<std::string> service;
    std::optional<std::string> emulator;
    std::optional<std::string> profile;
    std::optional<std::string> ca_file;
    std::optional<std::string> proxy;
    std::optional<std::string> session_file;
    std::optional<std::string> log_file;
    std::optional<int> timeout;
    std::optional<int> retries;
    std::string color = "auto"; ///< one of color_words
    bool insecure = false;
    bool plain_http = false;
    bool json = false;
    bool verbose = false;
};

struct login_arguments {
    std::optional<std::string> email;
    std::optional<std::string> password_file;
    std::optional<std::string> facebook_token_file;
    std::optional<std::string> app_id;
    std::optional<std::string> app_key_file;
    bool password_from_stdin = false;
};

struct login_token_arguments {
    login_arguments login;
    std::string token_file;
};

struct device_status_arguments {
    std::uint32_t device_id = 0;
};

/** Of the commands that take one entry. */
struct entry_arguments {
    std::string path = "/";
    std::optional<std::string> time; ///< of what is created
    bool long_form = false;          ///< of a listing
    bool parents = false;            ///< folders that are missing on the way are created too
    bool recursive = false;          ///< a folder, with all that it holds
};

/** Of mv and cp. */
struct transfer_arguments {
    std::string source;
    std::string destination;
    bool recursive = false;
};

/** Of put and get. */
struct put_arguments {
    std::vector<std::string> words; ///< sources, and behind them the destination
    bool recursive = false;
    bool quiet = false;
};
using get_arguments = put_arguments;

struct update_arguments {
    std::string source;
    std::string path;
    bool quiet = false;
};

struct set_arguments {
    std::string path;
    std::optional<std::string> name;
    std::optional<std::string> description;
    std::optional<std::string> tags;
    std::optional<std::string> privacy;
    std::optional<std::string> time;
    bool recursive = false;
};

struct links_arguments {
    std::string path;
    std::string type;
    bool download = false;
};

struct changes_arguments {
    std::string since = "0"; ///< a decimal number
    std::uint32_t device_id = 0;
    bool sample = false;
};

struct completion_arguments {
    std::string shell;
};

/** What a shell asks while a person types. */
struct complete_arguments {
    std::string what;   ///< "remote" or "profile"
    std::string prefix; ///< the word so far
};

struct mirror_arguments {
    std::string remote;
    std::string local;
    int interval = 30; ///< in seconds
    bool follow = false;
    bool dry_run = false;
    bool quiet = false;
};

struct arguments {
    common_arguments common;
    login_arguments login;
    login_token_arguments login_token;
    device_status_arguments device_status;
    entry_arguments entry;
    transfer_arguments transfer;
    put_arguments put;
    get_arguments get;
    update_arguments update;
    set_arguments set;
    links_arguments links;
    changes_arguments changes;
    completion_arguments completion;
    complete_arguments complete;
    mirror_arguments mirror;
};

} // namespace quillmere::tools
