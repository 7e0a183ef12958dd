// Connections that do not come about, or end before a byte of a reply.
#include "faults/fault.h"

namespace quillmere_test {
namespace {

const std::vector<wire> before_tls = {wire::http, wire::https_to_plain_server};
const std::vector<wire> in_handshake = {wire::https_to_plain_server};

// Reads something, the request or the client's part of a handshake, but takes it for nothing.
connection_script after_first_bytes(std::function<void(connection &)> then)
{
    return [then = std::move(then)](connection &client) {
        client.read_some();
        then(client);
    };
}

} // namespace

std::vector<fault> connection_faults()
{
    return {
        fault{"refused", {}, fails({CURLE_COULDNT_CONNECT}).seen(0, 0)}.towards(
            destination::nobody),
        fault{"unknown host", {}, fails({CURLE_COULDNT_RESOLVE_HOST}).seen(0, 0)}.towards(
            destination::unknown_host),
        fault{"stalled in connecting", {}, fails({CURLE_OPERATION_TIMEDOUT}).seen(0, 0)}
            .towards(destination::full_queue)
            .over({wire::http})
            .until_time_out(),
        fault{"closed on accept", {close}, fails({CURLE_GOT_NOTHING}).seen(0, 1)}.over(
            {wire::http}),
        fault{"closed on accept", {close}, fails({CURLE_SSL_CONNECT_ERROR}).seen(0, 1)}.over(
            in_handshake),
        // Sooner or later, and so in connecting, sending, or receiving.
        fault{"reset on accept",
              {reset},
              fails({CURLE_COULDNT_CONNECT, CURLE_SEND_ERROR, CURLE_RECV_ERROR}).seen(0, 1)}
            .over({wire::http}),
        fault{"reset on accept",
              {reset},
              fails({CURLE_COULDNT_CONNECT, CURLE_SSL_CONNECT_ERROR}).seen(0, 1)}
            .over(in_handshake),
        fault{"closed in the handshake",
              {after_first_bytes(close)},
              fails({CURLE_SSL_CONNECT_ERROR}).seen(0, 1)}
            .over(in_handshake),
        fault{"reset in the handshake",
              {after_first_bytes(reset)},
              fails({CURLE_SSL_CONNECT_ERROR}).seen(0, 1)}
            .over(in_handshake),
        fault{"stalled in the handshake",
              {after_first_bytes(stall)},
              fails({CURLE_OPERATION_TIMEDOUT}).seen(0, 1)}
            .over(in_handshake)
            .until_time_out(),
        fault{"plain answer to a handshake",
              {after_first_bytes(
                  [](connection &client) { client.send(http_reply(400, "speak plainly")); })},
              fails({CURLE_SSL_CONNECT_ERROR}).seen(0, 1)}
            .over(in_handshake),
        fault{"request instead of a handshake",
              {close},
              fails({CURLE_UNSUPPORTED_PROTOCOL, CURLE_GOT_NOTHING, CURLE_RECV_ERROR}).seen(0, 1)}
            .over({wire::http_to_tls_server}),
        fault{"closed after the request", {closing()}, fails({CURLE_GOT_NOTHING})},
        fault{"reset after the request", {resetting()}, fails({CURLE_RECV_ERROR})},
        fault{"stalled after the request", {stalling()}, fails({CURLE_OPERATION_TIMEDOUT})}
            .over({wire::http})
            .until_time_out(),
        fault{"reply lost after the work was done",
              {resetting(), answering(xml_reply(good_body))},
              fails_once({CURLE_RECV_ERROR}, succeeds())},
    };
}

} // namespace quillmere_test
