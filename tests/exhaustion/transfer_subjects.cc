// The calls that go over a socket: the exchange, the probes and the upload connection.
#include <memory>

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include "api/taken_results.h"
#include "exhaustion/subject.h"
#include "support/bound_socket.h"
#include "support/failure.h"
#include "transport/upload_connection.h"

namespace quillmere_test {
namespace {

call_outcome fetched(const std::string &url, const std::string &body)
{
    char *response = rubbish<char>();
    uint64_t length = 77;
    int64_t code = get_response_from_url(url.c_str(), body.empty() ? nullptr : body.data(),
                                         body.size(), &response, &length, 0);
    return {static_cast<int32_t>(code), std::nullopt,
            taken("response", response) + " length=" + std::to_string(length)};
}

// Everything an upload does, on one thread: the connection stands as soon as the kernel has it, and
// the reply waits in it before it is read.
class upload_to_ourselves {
public:
    call_outcome perform()
    {
        send_file *opened = rubbish<send_file>();
        int32_t result = send_file_new(&opened, url_.c_str(), 0, 5);
        if (result != 0)
            return {result, std::nullopt, opened ? "connection" : "no connection"};
        const owned_connection connection(opened);
        const descriptor peer = accepted();
        int32_t written = send_file_write(opened, "POST", 4);
        require(::write(peer.number(), "reply", 5) == 5, "write");
        char reply[16];
        int32_t read = send_file_read(opened, reply, sizeof reply);
        return {result, std::nullopt,
                "written=" + std::to_string(written) + " read=" + std::to_string(read)};
    }

private:
    descriptor accepted() const
    {
        pollfd waited = {listener_.number(), POLLIN, 0};
        ::poll(&waited, 1, -1);
        return descriptor(::accept(listener_.number(), nullptr, nullptr));
    }

    uint16_t port_ = 0;
    descriptor listener_ = listening_socket("127.0.0.1", port_);
    std::string url_ = url_of("http", "127.0.0.1", port_) + "/upload";
};

starved_call upload()
{
    auto connection = std::make_shared<upload_to_ourselves>();
    return [connection] { return connection->perform(); };
}

// What the base address leads to answers every request with this.
constexpr const char *answer = "answer";

} // namespace

std::vector<subject> transfer_subjects(const std::string &base_url)
{
    const std::string url = base_url + "/something";
    return {
        {"get", [url] { return [url] { return fetched(url, ""); }; }},
        {"post", [url] { return [url] { return fetched(url, "body"); }; }},
        {"check_url_response_code",
         [url] {
             return [url] {
                 return call_outcome{check_url_response_code(url.c_str(), 5000), std::nullopt, ""};
             };
         }},
        {"check_url_response",
         [url] {
             return [url] {
                 return call_outcome{check_url_response(url.c_str(), "a b", answer, 5000),
                                     std::nullopt, ""};
             };
         }},
        {"upload", upload},
    };
}

} // namespace quillmere_test
