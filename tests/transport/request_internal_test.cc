// The time that a request object is given.
#include "support/library_fixture.h"
#include "transport/easy_calls.h"

namespace quillmere_test {
namespace {

// The default is ten seconds.
class RequestTimeout : public library_test, public testing::WithParamInterface<timeout_case> {
protected:
    easy_calls calls;
};

TEST_P(RequestTimeout, IsTheDefaultUnlessItIsPositive)
{
    api_request *request = api_request_new();
    request->url = api_url_new_http("/api/some/thing.php");
    request->timeout = GetParam().given;
    char *message = nullptr;
    plain_server.answer(xml_reply("<response><result>Success</result></response>"));

    EXPECT_EQ(make_api_call(request, &message), 0);

    EXPECT_EQ(calls.last(CURLOPT_TIMEOUT).number, GetParam().used);
    EXPECT_EQ(request->timeout, GetParam().given);
    api_request_delete(&request);
}

INSTANTIATE_TEST_SUITE_P(All, RequestTimeout,
                         testing::Values(timeout_case{0, 10}, timeout_case{-1, 10},
                                         timeout_case{INT64_MIN, 10}, timeout_case{1, 1},
                                         timeout_case{77, 77}));

} // namespace
} // namespace quillmere_test
