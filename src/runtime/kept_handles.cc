#include "runtime/kept_handles.h"

#include <cstring>
#include <mutex>
#include <utility>

#include <unistd.h>

#include "runtime/memory.h"

namespace quillmere {

namespace {

bool reuse_enabled = false;

constexpr size_t most_handles = 16;
constexpr uint64_t no_generation = 0;

// Under what connections are made. Of the certificates it is enough to compare the object, which
// stands for one content of one file.
struct connection_terms {
    X509_STORE *certificates; // a reference
    bool verify_peer;
    int32_t ssl_disabled;
    proxy_settings proxy; // copies
};

// What waits to be used, all of one generation: made by one process under the same terms. Not
// destroyed when the process ends, since libcurl may be gone by then.
struct {
    CURL *handles[most_handles];
    size_t count;
    connection_terms terms;
    pid_t process;
    uint64_t generation = no_generation + 1;
} waiting;

std::mutex waiting_mutex; // guards it

// Handles to be cleaned up once the mutex is released, because closing connections takes its time.
struct dropped_handles {
    easy_handle handles[most_handles];
};

bool same(const char *one, const char *other)
{
    return one && other ? std::strcmp(one, other) == 0 : one == other;
}

bool same(const proxy_settings &one, const proxy_settings &other)
{
    return one.enabled == other.enabled && one.port == other.port && same(one.host, other.host) &&
           same(one.user, other.user) && same(one.password, other.password);
}

bool are_present(const connection_terms &terms, const X509_STORE *certificates)
{
    return terms.certificates == certificates &&
           terms.verify_peer == (ca_cert_pem_path.path != nullptr) &&
           terms.ssl_disabled == ssl_disabled && same(terms.proxy, proxy_server);
}

connection_terms present_terms(X509_STORE *certificates)
{
    if (certificates)
        X509_STORE_up_ref(certificates);
    proxy_settings proxy = proxy_server;
    proxy.host = try_copy_text(proxy_server.host);
    proxy.user = try_copy_text(proxy_server.user);
    proxy.password = try_copy_text(proxy_server.password);
    return {certificates, ca_cert_pem_path.path != nullptr, ssl_disabled, proxy};
}

void release(connection_terms &terms)
{
    X509_STORE_free(terms.certificates);
    std::free(terms.proxy.host);
    std::free(terms.proxy.user);
    std::free(terms.proxy.password);
    terms = {};
}

// Ends the generation. What a process has from before its fork it must not even close: that would
// tell the server that its parent is done.
void drop_all(dropped_handles &dropped)
{
    bool ours = waiting.process == getpid();
    for (size_t i = 0; i < waiting.count && ours; ++i)
        dropped.handles[i].reset(waiting.handles[i]);
    waiting.count = 0;
    release(waiting.terms);
    ++waiting.generation;
}

void begin_generation(X509_STORE *certificates, dropped_handles &dropped)
{
    drop_all(dropped);
    waiting.terms = present_terms(certificates);
    waiting.process = getpid();
}

} // namespace

bool keeps_connections() { return reuse_enabled; }

transfer_handle::transfer_handle(X509_STORE *certificates, source from)
{
    // Without a look at the certificates nobody knows whether they are still the same.
    if (reuse_enabled && (certificates || !ca_cert_pem_path.path)) {
        dropped_handles dropped;
        std::lock_guard<std::mutex> lock(waiting_mutex);
        if (waiting.process != getpid() || !are_present(waiting.terms, certificates))
            begin_generation(certificates, dropped);
        generation_ = waiting.generation;
        if (from == source::kept && waiting.count > 0)
            handle_.reset(waiting.handles[--waiting.count]);
    }
    is_used_ = handle_ != nullptr;
    if (!handle_)
        handle_.reset(curl_easy_init());
}

void transfer_handle::keep()
{
    if (generation_ == no_generation)
        return;
    curl_easy_reset(handle_.get());
    std::lock_guard<std::mutex> lock(waiting_mutex);
    if (generation_ == waiting.generation && waiting.count < most_handles)
        waiting.handles[waiting.count++] = handle_.release();
}

void drop_kept_handles()
{
    dropped_handles dropped;
    std::lock_guard<std::mutex> lock(waiting_mutex);
    drop_all(dropped);
}

} // namespace quillmere

void set_connection_reuse(int32_t enabled)
{
    quillmere::reuse_enabled = enabled != 0;
    if (!enabled)
        quillmere::drop_kept_handles();
}
