#include "faults/fault.h"

#include <cctype>
#include <ostream>
#include <utility>

#include "transport/exchange.h"

namespace quillmere_test {
namespace {

const char *wire_name(wire each)
{
    switch (each) {
    case wire::http:
        return "http";
    case wire::https:
        return "https";
    case wire::https_to_plain_server:
        return "https_to_a_plain_server";
    case wire::http_to_tls_server:
        return "http_to_a_tls_server";
    }
    return "";
}

template <class Field, class Value> fault changed(fault row, Field fault::*field, Value value)
{
    row.*field = std::move(value);
    return row;
}

} // namespace

const std::string good_body =
    "<response><result>Success</result><folder_key>key</folder_key></response>";

expectation expectation::seen(size_t requests_per_attempt, size_t connections_per_attempt) const
{
    expectation other = *this;
    other.requests = requests_per_attempt;
    other.connections = connections_per_attempt;
    return other;
}

expectation expectation::seen_elsewhere(size_t requests_per_attempt) const
{
    expectation other = *this;
    other.elsewhere = requests_per_attempt;
    return other;
}

expectation fails(std::vector<CURLcode> failures)
{
    expectation expected;
    expected.message = no_code;
    expected.failures = std::move(failures);
    return expected;
}

expectation yields(int64_t code, std::optional<std::string> body, int32_t status,
                   std::optional<std::string> message)
{
    expectation expected;
    expected.code = code;
    expected.body = std::move(body);
    expected.status = status;
    expected.message = std::move(message);
    expected.succeeds_at = 1;
    return expected;
}

expectation yields_unusable(int64_t code, std::optional<std::string> body, int32_t status)
{
    return yields(code, std::move(body), status,
                  "Response error: received server HTTP response code " + std::to_string(code));
}

expectation succeeds(int64_t code) { return yields(code, good_body, QM_OK, std::nullopt); }

expectation fails_once(std::vector<CURLcode> failures, expectation then)
{
    then.failures = std::move(failures);
    then.succeeds_at = 2;
    return then;
}

fault fault::over(std::vector<wire> others) const
{
    return changed(*this, &fault::wires, std::move(others));
}

fault fault::towards(destination other) const { return changed(*this, &fault::to, other); }

fault fault::trusting(trust other) const { return changed(*this, &fault::trusts, other); }

fault fault::showing(std::function<certificate()> other) const
{
    return changed(*this, &fault::shown, std::move(other));
}

fault fault::redirecting(wire other) const { return changed(*this, &fault::redirects_to, other); }

fault fault::until_time_out() const
{
    fault row = changed(*this, &fault::waits, true);
    row.timeout_seconds = 1;
    return row;
}

connection_script sending(std::string bytes, std::function<void(connection &)> then)
{
    return [bytes = std::move(bytes), then = std::move(then)](connection &client) {
        client.read_request();
        client.send(bytes);
        then(client);
    };
}

void close(connection &client) { client.close(); }

void reset(connection &client) { client.reset(); }

void stall(connection &client) { client.stall(); }

std::string trial::name() const
{
    std::string text = what.name + " over " + wire_name(on);
    for (char &each : text)
        if (!std::isalnum(static_cast<unsigned char>(each)))
            each = '_';
    return text;
}

void PrintTo(const trial &each, std::ostream *out) { *out << each.name(); }

std::vector<trial> trials_of(const std::vector<fault> &faults)
{
    std::vector<trial> trials;
    for (const fault &each : faults)
        for (wire on : each.wires)
            trials.push_back({each, on});
    return trials;
}

} // namespace quillmere_test
