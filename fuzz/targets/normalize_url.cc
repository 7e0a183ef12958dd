// Links without a scheme: a line with the scheme that they get, then the link.
#include "support/choices.h"
#include "support/library.h"

namespace quillmere_fuzz {
namespace {

std::string expected_url(const std::string &url, const std::string &scheme)
{
    size_t slashes = url.find("//");
    bool found = slashes != std::string::npos && slashes + 3 <= url.size();
    if (!found || (slashes > 0 && url[slashes - 1] == ':'))
        return url;
    return scheme + ":" + url;
}

void try_url(std::string_view input)
{
    choices chosen(input);
    std::string scheme = chosen.line();
    std::string url(chosen.rest());
    url.resize(url.find('\0') == std::string::npos ? url.size() : url.find('\0'));
    owned_text normal;
    within_budget(linear, input.size(),
                  [&] { normal.reset(normalize_url(url.c_str(), scheme.c_str())); });

    expect(normal && normal.get() == expected_url(url, scheme), "the link with its scheme");
    owned_text copy(normalize_url(url.c_str(), nullptr));
    expect(copy && copy.get() == url, "the link without a scheme to give it");
}

const known_target normal("normalize_url", try_url);

} // namespace
} // namespace quillmere_fuzz
