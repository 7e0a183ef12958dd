// Proxies that do not let anything through. Over http a proxy is asked for the whole URL, over
// https for a tunnel.
#include "faults/fault.h"

namespace quillmere_test {
namespace {

const std::vector<wire> plainly = {wire::http};
const std::vector<wire> by_tunnel = {wire::https_to_plain_server};

fault by_proxy(const std::string &name, connection_script script, expectation expected)
{
    return fault{name, {std::move(script)}, std::move(expected)}.towards(
        destination::server_as_proxy);
}

fault refusing(const std::string &name, int status)
{
    return by_proxy(name, answering(http_reply(status, "the proxy's own page")),
                    yields_unusable(status, "the proxy's own page", QM_MALFORMED_REPLY))
        .over(plainly);
}

fault refusing_tunnel(const std::string &name, int status)
{
    return by_proxy(name, answering(http_reply(status, "the proxy's own page")),
                    fails({CURLE_RECV_ERROR}))
        .over(by_tunnel);
}

} // namespace

std::vector<fault> proxy_faults()
{
    return {
        fault{"no proxy there", {}, fails({CURLE_COULDNT_CONNECT}).seen(0, 0)}
            .towards(destination::nobody_as_proxy)
            .over({wire::http, wire::https_to_plain_server}),
        refusing("proxy refuses", 403),
        refusing("proxy wants a password", 407),
        refusing_tunnel("proxy refuses", 403),
        refusing_tunnel("proxy wants a password", 407),
        by_proxy("proxy closes", closing(), fails({CURLE_GOT_NOTHING})).over(plainly),
        by_proxy("proxy closes in CONNECT", closing(), fails({CURLE_RECV_ERROR})).over(by_tunnel),
        by_proxy("proxy resets in CONNECT", resetting(), fails({CURLE_RECV_ERROR})).over(by_tunnel),
        by_proxy("proxy is cut off in CONNECT", sending("HTTP/1.1 200 Conn", close),
                 fails({CURLE_RECV_ERROR}))
            .over(by_tunnel),
        by_proxy("proxy stalls in CONNECT", stalling(), fails({CURLE_OPERATION_TIMEDOUT}))
            .over(by_tunnel)
            .until_time_out(),
        by_proxy("tunnel ends at once",
                 sending("HTTP/1.1 200 Connection established\r\n\r\n", close),
                 fails({CURLE_SSL_CONNECT_ERROR}))
            .over(by_tunnel),
    };
}

} // namespace quillmere_test
