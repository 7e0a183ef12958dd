// The change feed: what became of the account's entries since a revision.

#include "commands.h"

#include <CLI/CLI.hpp>

#include "../account.h"
#include "../change_feed.h"
#include "../record_fields.h"

namespace quillmere::tools {

namespace {

struct feed {
    std::uint64_t revision = 0; // up to which the changes reach
    std::int32_t block_size = 0;
    result_table changes = {"changes",
                            {{"revision", "Revision"},
                             {"change", "Change"},
                             {"kind", "Kind"},
                             {"key", "Key"},
                             {"parent_key", "In folder"},
                             {"name", "Name"}},
                            {}};
};

constexpr record_field<change_info> text_fields[] = {
    {"key", nullptr, change_info_get_key},
    {"parent_key", nullptr, change_info_get_parent_folderkey},
    {"name", nullptr, change_info_get_filename},
    {"created", nullptr, change_info_get_created},
    {"mimetype", nullptr, change_info_get_mimetype},
    {"filetype", nullptr, change_info_get_filetype},
};

std::vector<fact> facts_of_change(const change_info *record)
{
    const bool deleted = change_info_get_changetype(record) == 0;
    const bool folder = change_info_get_is_folder(record) != 0;
    std::vector<fact> facts = {
        {"revision", nullptr, change_info_get_revision(record)},
        {"change", nullptr, deleted ? "deleted" : "updated"},
        {"kind", nullptr, word_for(folder ? entry_kind::folder : entry_kind::file)}};
    for (fact &each : facts_of(record, text_fields))
        facts.push_back(std::move(each));
    return facts;
}

void add_block(const change_block &read, feed &whole)
{
    for (const change_info *each : in_order_sent(read.changes.get()))
        whole.changes.rows.push_back(facts_of_change(each));
    whole.block_size = read.size;
}

// A reply holds a block of the feed. There may be more as long as the revision grows.
feed read_feed(const account &owner, std::uint64_t since, std::uint32_t device)
{
    feed whole;
    whole.revision = since;
    for (;;) {
        const change_block next = read_changes(owner, whole.revision, device);
        add_block(next, whole);
        if (next.revision <= whole.revision)
            return whole;
        whole.revision = next.revision;
    }
}

feed read_sample()
{
    change_block sample;
    char *message = nullptr;
    ask_for_changes("", 0, 0, test_get_device_changes, sample, &message);
    const heap_text owned(message);
    feed whole;
    add_block(sample, whole);
    whole.revision = sample.revision;
    return whole;
}

// The option's own reading of numbers takes -1 for the largest there is.
std::string complaint_about_number(const std::string &text)
{
    return decimal_number(text) ? "" : text + " is no revision";
}

} // namespace

void declare_changes(CLI::App &options, arguments &given)
{
    changes_arguments &changes = given.changes;
    auto *const since =
        options
            .add_option("--since", changes.since, "Revision that is known already; 0 unless given")
            ->option_text("REVISION")
            ->check(complaint_about_number);
    auto *const device =
        options.add_option("--device", changes.device_id, "Number of the device; 0 unless given")
            ->option_text("NUMBER");
    options
        .add_flag("--sample", changes.sample,
                  "Show a feed that is built in, without asking the service")
        ->excludes(since)
        ->excludes(device);
}

void run_changes(command_context &context)
{
    const changes_arguments &given = context.given.changes;
    const std::uint64_t since = decimal_number(given.since).value_or(0);
    const feed whole = given.sample ? read_sample()
                                    : read_feed(signed_in_account(context), since, given.device_id);
    context.output.rows({{"since", nullptr, since},
                         {"device_revision", "Revision", whole.revision},
                         {"block_size", nullptr, whole.block_size}},
                        whole.changes);
}

} // namespace quillmere::tools
