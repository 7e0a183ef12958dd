// Request objects: one call of the service's interface, composed, performed and judged.
#include <cstdlib>
#include <cstring>
#include <utility>

#include "runtime/memory.h"
#include "transport/failed_exchange.h"

namespace quillmere {

namespace {

string_buffer *url_on(const char *base, const char *path)
{
    string_buffer *url = string_new(256);
    string_append(url, base);
    string_append(url, path);
    string_append(url, "?");
    return url;
}

int64_t exchange(api_request &request)
{
    const char *url = request.url ? string_get(request.url) : nullptr;
    const char *redacted = request.url ? string_get_obfs(request.url, nullptr) : nullptr;
    const char *body = request.post_data ? string_get(request.post_data) : nullptr;
    uint64_t body_length = request.post_data ? string_get_size(request.post_data) : 0;
    std::free(std::exchange(request.response, nullptr)); // of an earlier call

    if (request.verbose)
        qm_printf("Api url:\n%s\n", redacted);
    int64_t response_code = get_response_from_url(url, body, body_length, &request.response,
                                                  &request.response_length, request.timeout);
    if (request.verbose)
        qm_printf("Got text:\n%s\n", request.response);
    return response_code;
}

int32_t refusal(const api_request &request, char **message)
{
    int32_t status = 0;
    get_error_from_xml(request.response, request.response_length, &status, message);
    if (check_api_error)
        check_api_error(request.url ? string_get(request.url) : nullptr, request.response, status,
                        *message);
    return status;
}

int32_t failure(int64_t response_code, char **message)
{
    *message = failed_exchange_message(response_code).release();
    return failed_exchange_status(response_code);
}

} // namespace

} // namespace quillmere

using namespace quillmere;

string_buffer *api_url_new_https(const char *path) { return url_on(urls[1], path); }

string_buffer *api_url_new_http(const char *path) { return url_on(urls[0], path); }

api_request *api_request_new(void)
{
    auto *request = allocate_zeroed<api_request>();
    request->verbose = 1;
    return request;
}

int32_t make_api_call(api_request *request, char **message)
{
    int64_t response_code = exchange(*request);
    if (!request->response)
        return failure(response_code, message);

    int32_t parse_failed = 0;
    heap_text result(simple_get_xml_node_value(request->response, request->response_length,
                                               "result", &parse_failed));
    int32_t status = QM_OK;
    if (!result)
        status = failure(response_code, message);
    else if (std::strcmp(result.get(), "Success") != 0)
        status = refusal(*request, message);
    // Damage overrides whatever was read, but the message stays.
    return parse_failed ? QM_MALFORMED_REPLY : status;
}

void api_request_delete(api_request **request)
{
    if (!request || !*request)
        return;
    string_delete((*request)->url, 1);
    string_delete((*request)->post_data, 1);
    std::free((*request)->response);
    std::free(*request);
}
