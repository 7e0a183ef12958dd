// What reading a folder's listing costs an entry, for listings of a thousand entries and more,
// beside expat's own pass over the same reply with empty handlers. The cost of an entry must not
// grow with the listing.
#include <string>

#include <benchmark/benchmark.h>
#include <expat.h>

#include "quillmere.h"

namespace {

std::string file_entry(int64_t number)
{
    std::string digits = std::to_string(number);
    return "<file><quickkey>k" + digits + "</quickkey><filename>file " + digits +
           ".txt</filename><created>2026-01-01 00:00:00</created><downloads>0</downloads>"
           "<desc></desc><tags>a,b</tags><size>4096</size><privacy>private</privacy>"
           "<filetype>text</filetype><mimetype>text/plain</mimetype>"
           "<hash>e3b0c44298fc1c149afbf4c8996fb92427ae41e4649b934ca495991b7852b855</hash>"
           "<password_protected>no</password_protected><revision>" +
           digits + "</revision><owner_name>Ada</owner_name><flag>1</flag></file>";
}

std::string listing(int64_t entries)
{
    std::string reply = "<response><folder_content><files>";
    for (int64_t number = 0; number < entries; ++number)
        reply += file_entry(number);
    return reply + "</files></folder_content><result>Success</result></response>";
}

void extract_listing(benchmark::State &state)
{
    FILE *nowhere = fopen("/dev/null", "w");
    set_output_file(nowhere);
    std::string reply = listing(state.range(0));
    for (auto _ : state) {
        folder_list *folders = folder_info_list_new();
        file_list *files = file_info_list_new();
        int32_t folder_count = 0;
        int32_t file_count = 0;
        simple_extract_folders_content(reply.data(), reply.size(), folders, &folder_count, files,
                                       &file_count);
        delete_all_folder_list(&folders);
        delete_all_file_list(&files);
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
    set_output_file(nullptr);
    fclose(nowhere);
}
BENCHMARK(extract_listing)->Arg(1000)->Arg(10000)->Arg(100000)->Unit(benchmark::kMillisecond);

void parse_listing(benchmark::State &state)
{
    std::string reply = listing(state.range(0));
    for (auto _ : state) {
        XML_Parser parser = XML_ParserCreate("UTF-8");
        XML_SetElementHandler(
            parser, [](void *, const char *, const char **) {}, [](void *, const char *) {});
        XML_SetCharacterDataHandler(parser, [](void *, const char *, int) {});
        XML_Parse(parser, reply.data(), static_cast<int>(reply.size()), XML_TRUE);
        XML_ParserFree(parser);
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}
BENCHMARK(parse_listing)->Arg(1000)->Arg(10000)->Arg(100000)->Unit(benchmark::kMillisecond);

} // namespace
