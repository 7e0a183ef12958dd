// What the text functions cost, each beside what it is compared with:
//
//   text_bench                    everything
//   text_bench --benchmark_filter=lookup
//
// The lookup of a text with a line break at every byte stands beside that of one without: expat
// hands over such a text in a piece for every byte, and joining them must not cost more a byte for
// it.
#include <string>

#include <benchmark/benchmark.h>
#include <curl/curl.h>
#include <expat.h>

#include "quillmere.h"

namespace {

std::string letters(benchmark::State &state)
{
    return std::string(static_cast<size_t>(state.range(0)), 'a');
}

void encode_with_the_library(benchmark::State &state)
{
    std::string text = letters(state);
    for (auto _ : state) {
        string_buffer *buffer = string_new(256);
        benchmark::DoNotOptimize(string_append_urlencode(buffer, text.c_str()));
        string_delete(buffer, 1);
    }
}
BENCHMARK(encode_with_the_library)->Arg(16)->Arg(1024);

void encode_with_libcurl(benchmark::State &state)
{
    std::string text = letters(state);
    CURL *handle = curl_easy_init();
    for (auto _ : state) {
        string_buffer *buffer = string_new(256);
        char *escaped = curl_easy_escape(handle, text.c_str(), 0);
        benchmark::DoNotOptimize(string_append(buffer, escaped));
        curl_free(escaped);
        string_delete(buffer, 1);
    }
    curl_easy_cleanup(handle);
}
BENCHMARK(encode_with_libcurl)->Arg(16)->Arg(1024);

std::string reply_with(const std::string &text)
{
    return "<response><value>" + text + "</value></response>";
}

void look_up(benchmark::State &state, const std::string &text)
{
    std::string reply = reply_with(text);
    for (auto _ : state) {
        int32_t parse_failed = 0;
        char *value =
            simple_get_xml_node_value(reply.c_str(), reply.size(), "value", &parse_failed);
        benchmark::DoNotOptimize(value);
        api_free(value);
    }
    state.SetBytesProcessed(state.iterations() * static_cast<int64_t>(reply.size()));
}

void parse(benchmark::State &state, const std::string &text)
{
    std::string reply = reply_with(text);
    for (auto _ : state) {
        XML_Parser parser = XML_ParserCreate("UTF-8");
        XML_SetElementHandler(
            parser, [](void *, const char *, const char **) {}, [](void *, const char *) {});
        XML_SetCharacterDataHandler(parser, [](void *, const char *, int) {});
        XML_Parse(parser, reply.data(), static_cast<int>(reply.size()), XML_TRUE);
        XML_ParserFree(parser);
    }
    state.SetBytesProcessed(state.iterations() * static_cast<int64_t>(reply.size()));
}

constexpr size_t megabyte = 1000000;

BENCHMARK_CAPTURE(look_up, plain, std::string(megabyte, 'a'));
BENCHMARK_CAPTURE(parse, plain, std::string(megabyte, 'a'));
BENCHMARK_CAPTURE(look_up, line_breaks, std::string(megabyte, '\n'));
BENCHMARK_CAPTURE(parse, line_breaks, std::string(megabyte, '\n'));

} // namespace
