// What the library costs beside the network: operations whose replies come from memory, beside the
// same delivery and one pass of expat; the encoder beside libcurl's; a long listing beside a short
// one, and the memory that it takes.
//
//   memory_bench
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <functional>
#include <memory>
#include <string>

#include <sys/wait.h>
#include <unistd.h>

#include "calls.h"
#include "demanded.h"
#include "measured.h"
#include "quillmere.h"
#include "references.h"
#include "replies.h"

namespace {

const std::string *delivered = nullptr;

} // namespace

extern "C" {

// In the place of the exchange with the service.
int64_t deliver(const char *url, const void *body, uint64_t body_length, char **response,
                uint64_t *response_length,
                int64_t timeout_seconds) __asm__("__wrap_get_response_from_url");

int64_t deliver(const char *, const void *, uint64_t, char **response, uint64_t *response_length,
                int64_t)
{
    *response_length = delivered->size();
    *response = static_cast<char *>(std::malloc(*response_length + 1));
    std::memcpy(*response, delivered->c_str(), *response_length + 1);
    return 200;
}
}

namespace {

using namespace quillmere_bench;

void deliver_and_parse()
{
    char *response = nullptr;
    uint64_t length = 0;
    deliver("", nullptr, 0, &response, &length, 0);
    parse_once(response, length);
    std::free(response);
}

void measure_operation(const std::string &what, double at_most, const std::string &reply,
                       void (*operation)(), unsigned calls)
{
    delivered = &reply;
    measure({what, at_most, operation, deliver_and_parse, calls});
}

// The least that an operation could cost: the same delivery and pass, and what the interface
// demands.
void measure_demand(const std::string &reply, void (*demand)(), unsigned calls)
{
    delivered = &reply;
    auto least = [demand] {
        deliver_and_parse();
        demand();
    };
    measure({"the pass, and what the interface demands, alone", no_figure, least, deliver_and_parse,
             calls});
}

void log_delivered() { log_lines(delivered->c_str()); }

void demand_of_folder()
{
    log_delivered();
    make_folder_record();
}

void demand_of_user()
{
    log_delivered();
    make_user_record();
}

void demand_of_content()
{
    log_delivered();
    make_listing();
}

void demand_of_changes()
{
    log_delivered();
    make_change_list();
}

void measure_operations()
{
    const std::string thousand = listing(1000);
    measure_operation("`get_folder_info` from memory, 24 values", 1.15, folder_record(),
                      call_folder_info, 1500);
    measure_demand(folder_record(), demand_of_folder, 1500);
    measure_operation("`get_user_info` from memory, 39 values", 1.15, user_record(), call_user_info,
                      1000);
    measure_demand(user_record(), demand_of_user, 1500);
    measure_operation("`get_folder_content` from memory, 100 entries", 1.45, listing(100),
                      call_folder_content, 30);
    measure_operation("`get_folder_content` from memory, 1,000 entries", 1.45, thousand,
                      call_folder_content, 4);
    measure_demand(thousand, demand_of_content, 4);
    measure_operation("`get_device_changes` from memory, 500 entries", 1.50, change_feed(500),
                      call_device_changes, 8);
    measure_demand(change_feed(500), demand_of_changes, 8);
}

// Per entry, against a listing of a thousand.
void measure_growth()
{
    const std::string many = listing(100000);
    const std::string few = listing(1000);
    auto repeated = [](const std::string &reply, int times, void (*work)()) {
        delivered = &reply;
        for (int time = 0; time < times; ++time)
            work();
    };
    measure({"100,000 entries beside 100 times 1,000", 1.10,
             [&] { repeated(many, 1, call_folder_content); },
             [&] { repeated(few, 100, call_folder_content); }},
            15);
    measure({"the same of delivery and expat alone", no_figure,
             [&] { repeated(many, 1, deliver_and_parse); },
             [&] { repeated(few, 100, deliver_and_parse); }},
            15);
}

struct curl_text_releaser {
    void operator()(char *text) const { curl_free(text); }
};

void measure_encoding(const std::string &what, const std::string &text)
{
    raw_handle handle(curl_easy_init());
    auto with = [](const std::function<void(string_buffer *)> &append) {
        string_buffer *buffer = string_new(256);
        append(buffer);
        string_delete(buffer, 1);
    };
    measure({"`string_append_urlencode`, " + what, 0.30,
             [&] {
                 with(
                     [&](string_buffer *buffer) { string_append_urlencode(buffer, text.c_str()); });
             },
             [&] {
                 with([&](string_buffer *buffer) {
                     std::unique_ptr<char, curl_text_releaser> escaped(
                         curl_easy_escape(handle.get(), text.c_str(), 0));
                     string_append(buffer, escaped.get());
                 });
             },
             5000});
}

void measure_encoder()
{
    measure_encoding("16 B of letters", std::string(16, 'a'));
    measure_encoding("48 B of letters", std::string(48, 'a'));
    measure_encoding("1 KB of letters", std::string(1024, 'a'));
    measure_encoding("1 KB, all encoded", std::string(1024, '/'));
}

size_t status_kilobytes(const std::string &field)
{
    std::ifstream status("/proc/self/status");
    for (std::string line; std::getline(status, line);)
        if (line.compare(0, field.size(), field) == 0)
            return std::stoul(line.substr(field.size()));
    return 0;
}

void forget_peak() { std::ofstream("/proc/self/clear_refs") << 5; }

// What some work holds at its peak, in multiples of the reply.
double held_at_peak(const std::function<void()> &work)
{
    forget_peak();
    auto before = static_cast<double>(status_kilobytes("VmRSS:"));
    work();
    double taken = static_cast<double>(status_kilobytes("VmHWM:")) - before;
    return taken * 1024 / static_cast<double>(delivered->size());
}

// In a process of its own: what others have freed would be used again here.
void measure_memory()
{
    std::fflush(nullptr);
    pid_t child = ::fork();
    if (child != 0) {
        ::waitpid(child, nullptr, 0);
        return;
    }
    const std::string reply = listing(100000);
    delivered = &reply;
    file_list *files = nullptr;
    double of_call = held_at_peak([&] { files = listed_files(); }) - 1; // the reply itself
    double of_blocks = held_at_peak([&] { copy_of(files); });
    std::printf("\nA listing of 100,000 entries, %.1f MiB: at its peak the call holds %.2f times "
                "that beyond the reply itself (asked: 1.40).\nThe same list, its records and their "
                "values alone, made anew: %.2f times.\n",
                static_cast<double>(reply.size()) / (1024 * 1024), of_call, of_blocks);
    std::fflush(nullptr);
    ::_exit(0);
}

} // namespace

int main()
{
    std::FILE *nowhere = std::fopen("/dev/null", "w");
    set_output_file(nowhere); // the log is written all the same
    measure_memory();
    api_global_init(nullptr);
    print_heading();
    measure_operations();
    measure_growth();
    measure_encoder();
    api_global_cleanup();
    set_output_file(nullptr);
    std::fclose(nowhere);
}
