#include "admin.h"

#include <iostream>
#include <limits>
#include <optional>
#include <string_view>
#include <utility>

#include <nlohmann/json.hpp>

#include "fault_json.h"
#include "form.h"
#include "text.h"

namespace emulator {
namespace {

using json = nlohmann::ordered_json;

constexpr std::uint64_t largest_body = 64 * 1024;
constexpr std::size_t most_connections = 64;

reply json_reply(unsigned status, const json &told)
{
    // What came from a client may be no UTF-8; the reply must be it all the same.
    const std::string text = told.dump(-1, ' ', false, json::error_handler_t::replace) + "\n";
    return {status, text, {}, {{"Content-Type", "application/json"}}};
}

reply failure(unsigned status, const std::string &why)
{
    return json_reply(status, {{"error", why}});
}

/** A request on its way. */
struct errand {
    const request &asked;
    const administered &state;
    std::uint64_t id; // of the fault that the path names
};

reply tell_health(const errand &)
{
    return json_reply(200, {{"status", "ok"}, {"version", QUILLMERE_EMULATOR_VERSION}});
}

reply tell_requests(const errand &made)
{
    const request_counts &requests = made.state.requests;
    return json_reply(200, {{"total", requests.total()}, {"endpoints", requests.by_endpoint()}});
}

reply tell_faults(const errand &made)
{
    json list = json::array();
    for (const placed_fault &each : made.state.faults.all())
        list.push_back(tell_fault(each));
    return json_reply(200, {{"faults", list}});
}

reply tell_one_fault(const errand &made)
{
    const placed_fault *found = made.state.faults.find(made.id);
    return found ? json_reply(200, tell_fault(*found)) : failure(404, "there is no such fault");
}

reply place_fault(const errand &made)
{
    const auto id = made.state.faults.place(read_fault(made.asked.body, made.state.some_seed()));
    if (!id)
        return failure(409, "there are " + std::to_string(fault_list::most) +
                                " faults, and no more can be: remove some");
    return json_reply(201, {{"id", *id}});
}

reply remove_fault(const errand &made)
{
    return made.state.faults.remove(made.id) ? json_reply(200, json::object())
                                             : failure(404, "there is no such fault");
}

reply remove_faults(const errand &made)
{
    made.state.faults.clear();
    return json_reply(200, json::object());
}

reply reset_trees_of_all(const errand &made)
{
    made.state.reset();
    return json_reply(200, json::object());
}

struct route {
    const char *path; // one that ends in "/" has the number of a fault behind it
    const char *method;
    reply (*serve)(const errand &);
};

constexpr route routes[] = {
    {"/health", "GET", tell_health},      {"/requests", "GET", tell_requests},
    {"/faults", "GET", tell_faults},      {"/faults", "POST", place_fault},
    {"/faults", "DELETE", remove_faults}, {"/faults/", "GET", tell_one_fault},
    {"/faults/", "DELETE", remove_fault}, {"/reset", "POST", reset_trees_of_all},
};

std::optional<std::uint64_t> id_in(std::string_view path, std::string_view beginning)
{
    if (path.substr(0, beginning.size()) != beginning)
        return std::nullopt;
    path.remove_prefix(beginning.size());
    return parse_decimal(path, std::numeric_limits<std::uint64_t>::max());
}

/** The number that the path names, or 0 if it needs none; nothing if it is not of this route. */
std::optional<std::uint64_t> matched(const route &row, std::string_view path)
{
    const std::string_view own = row.path;
    if (own.back() == '/')
        return id_in(path, own);
    return own == path ? std::optional<std::uint64_t>(0) : std::nullopt;
}

reply wrong_method(const std::string &allowed)
{
    reply refused = failure(405, "this path knows the methods: " + allowed);
    refused.fields.push_back({"Allow", allowed});
    return refused;
}

reply find_and_serve(const request &asked, const administered &state)
{
    std::string allowed;
    for (const route &row : routes) {
        const auto id = matched(row, split(asked.target).path);
        if (id && asked.method == row.method)
            return row.serve({asked, state, *id});
        if (id)
            allowed += (allowed.empty() ? "" : ", ") + std::string(row.method);
    }
    if (!allowed.empty())
        return wrong_method(allowed);
    return failure(404, "the paths are: /health, /requests, /faults, /faults/ID, /reset");
}

} // namespace

reply administer(const request &asked, const administered &state)
{
    // Whatever page a browser shows can send requests to this machine; none has business here.
    if (!asked.web_page.empty())
        return failure(403, "requests from web pages (with an Origin) are refused");
    try {
        return find_and_serve(asked, state);
    } catch (const fault_refusal &why) {
        return failure(400, why.what());
    } catch (const std::exception &problem) {
        std::cerr << "quillmere-emulator: admin: " << problem.what() << std::endl;
        return failure(500, "internal error");
    }
}

request_handlers admin_handlers(administered state)
{
    return {
        [state = std::move(state)](const request &asked) { return administer(asked, state); },
        [](const request &) { return nullptr; },
        [](const refusal &why) { return failure(row_of(why.number()).http_status, why.what()); },
    };
}

server_limits admin_limits()
{
    server_limits limits;
    limits.body_bytes = largest_body;
    limits.connections = most_connections;
    return limits;
}

} // namespace emulator
