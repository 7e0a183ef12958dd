// The bytes of files, by the links that the service gives for them.
#pragma once

#include <cstddef>
#include <map>
#include <string>
#include <vector>

#include "../account.h"
#include "../settings.h"
#include "download.h"

namespace quillmere::tools {

class linked_content {
public:
    /** Far below what the service and an address can take. */
    static constexpr std::size_t links_at_once = 100;

    /** The account outlives it. */
    linked_content(const account &owner, const settings &chosen, link_security security,
                   progress_style style);

    /** Asks for the links of files, by their keys; those of others are forgotten. */
    void ask_for_links(const std::vector<std::string> &keys);

    /** Throws failure for a file whose link was not given. The path names it. */
    const std::string &require_link(const std::string &key, const std::string &path) const;

    /** Fetches what the beginning of a file lacks; a failure unless it is right then. */
    void bring(const std::string &key, const std::string &path, partial_file &partial);

private:
    struct link {
        std::string url;
        std::string refusal; ///< why there is none
    };

    void fetch(const std::string &url, const std::string &path, partial_file &into);

    const account &owner_;
    progress_style style_;
    downloader downloader_;
    std::map<std::string, link> links_; // by quick key
};

} // namespace quillmere::tools
