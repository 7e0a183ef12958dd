// Requests to the emulator, one to a line: "METHOD target", and perhaps, behind tabs, the content
// type, the body, and the range.
#include "router.h"
#include "links.h"
#include "support/choices.h"
#include "support/emulated_service.h"

namespace quillmere_fuzz {
namespace {

std::string take_until(std::string &line, char end)
{
    std::string taken = line.substr(0, line.find(end));
    line.erase(0, taken.size() + 1);
    return taken;
}

emulator::request request_in(std::string line)
{
    emulator::request asked;
    asked.method = take_until(line, ' ');
    asked.target = take_until(line, '\t');
    asked.content_type = take_until(line, '\t');
    asked.body = take_until(line, '\t');
    asked.range = line;
    asked.origin = "https://localhost:4711";
    return asked;
}

bool is_link(const std::string &target)
{
    return emulator::link_kind_of(std::string_view(target).substr(0, target.find('?'))) != nullptr;
}

void check_reply(const emulator::request &asked, const emulator::reply &made)
{
    if (!is_link(asked.target))
        return expect_envelope(made);
    expect(made.http_status >= 200 && made.http_status < 500, "the status of a link");
}

void try_requests(std::string_view input)
{
    choices chosen(input);
    emulated_service service;
    uint64_t revision = service.revision();
    for (int requests = 0; chosen.left() && requests < 8; ++requests) {
        emulator::request asked = request_in(service.filled_in(chosen.line()));
        emulator::reply made;
        within_budget(served, input.size(),
                      [&] { made = emulator::answer(asked, service.state()); });
        check_reply(asked, made);
        uint64_t now = service.revision();
        expect(now >= revision, "the revision of a tree never goes back");
        expect(now == revision || made.http_status == 200, "a refusal changes nothing");
        revision = now;
    }
}

const known_target router("router", try_requests);

} // namespace
} // namespace quillmere_fuzz
