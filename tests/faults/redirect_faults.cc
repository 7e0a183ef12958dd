// Redirects that lead nowhere, or to where they must not.
#include "faults/fault.h"

namespace quillmere_test {
namespace {

constexpr size_t hops = 31; // thirty redirects are followed

connection_script moved_to(const std::string &location)
{
    return answering(http_reply(302, "moved", {"Location: " + location}));
}

connection_script to_itself()
{
    return answering_with([](const request &asked) {
        return http_reply(302, "moved", {"Location: " + asked.target});
    });
}

fault to_protocol(const std::string &name, const std::string &location)
{
    return {"redirect to " + name, {moved_to(location)}, fails({CURLE_UNSUPPORTED_PROTOCOL})};
}

} // namespace

std::vector<fault> redirect_faults()
{
    return {
        {"redirect to itself", {to_itself()}, fails({CURLE_TOO_MANY_REDIRECTS}).seen(hops, hops)},
        {"redirect without a location",
         {answering(http_reply(302, "moved, but where to?"))},
         yields_unusable(302, "moved, but where to?", QM_MALFORMED_REPLY)},
        fault{"redirect to https", {}, succeeds().seen_elsewhere(1)}.redirecting(wire::https),
        fault{"redirect to http", {}, succeeds().seen_elsewhere(1)}
            .redirecting(wire::http)
            .over({wire::http}),
        fault{"redirect to http", {}, fails({CURLE_UNSUPPORTED_PROTOCOL})}
            .redirecting(wire::http)
            .over({wire::https}),
        to_protocol("a file", "file:///etc/hostname"),
        to_protocol("ftp", "ftp://127.0.0.1:1/file"),
        to_protocol("gopher", "gopher://127.0.0.1:1/file"),
        to_protocol("nothing known", "nothing-known://127.0.0.1:1/file"),
    };
}

} // namespace quillmere_test
