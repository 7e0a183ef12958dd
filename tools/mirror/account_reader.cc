#include "account_reader.h"

#include <utility>

#include "../change_feed.h"
#include "../text.h"
#include "../transfers/remote_file.h"

namespace quillmere::tools {

namespace {

// The service's number for a parameter that is not valid: a revision that the account has not
// reached, since it is from before the account's tree was begun anew.
constexpr std::int32_t parameter_invalid = 106;

constexpr int rounds_of_news = 4;
constexpr int listings_of_a_folder = 5;
constexpr std::size_t steps_between_keeping = 200;

std::string checked_key(const char *key)
{
    if (key == nullptr || !is_key(key))
        throw failure(exit_code::unreadable_answer, "the service sent a key that is none");
    return key;
}

entry_change change_of(const change_info *record)
{
    const bool folder = change_info_get_is_folder(record) != 0;
    return {checked_key(change_info_get_key(record)),
            folder ? entry_kind::folder : entry_kind::file, change_info_get_changetype(record) == 0,
            text_or_empty(change_info_get_parent_folderkey(record))};
}

// An entry that never got content is an empty file.
expected_content content_of(const file_info *record)
{
    const remote_file file = remote_file_of(record);
    if (file.has_content || file.content.size > 0)
        return file.content;
    return {0, hex_of(sha256_sum().finish())};
}

known_entry known_entry_of(const folder_info *record)
{
    known_entry entry;
    entry.name = text_or_empty(folder_info_get_foldername(record));
    return entry;
}

known_entry known_entry_of(const file_info *record)
{
    known_entry entry;
    entry.kind = entry_kind::file;
    entry.name = text_or_empty(file_info_get_filename(record));
    entry.content = content_of(record);
    return entry;
}

} // namespace

bool account_reader::update(known_account &known)
{
    bool any = !known.has_begun() || !known.unfinished().empty();
    if (!known.has_begun())
        begin(known);
    // What is new while it is being learned is learned in the next round. An account that never
    // rests must not keep the mirror from its work, though.
    for (int round = 0; round < rounds_of_news; ++round) {
        const bool more = take_in_news(known);
        any = any || more;
        if (!more && (round > 0 || known.unfinished().empty()))
            break;
        fill(known);
    }
    return any;
}

void account_reader::begin(known_account &known)
{
    std::string current_epoch = epoch();
    // The revision comes ahead of the listings: what changes meanwhile, the feed tells once more.
    known.begin(device_revision(), std::move(current_epoch));
    keep_();
    fill(known);
}

bool account_reader::take_in_news(known_account &known)
{
    std::optional<news> told = read_news(known);
    if (!told) {
        begin(known);
        return true;
    }
    const bool any = !told->changes.empty();
    known.apply(told->changes, told->revision);
    if (known.entries.count(known.root) == 0)
        throw failure(exit_code::refused, "the mirrored folder is gone from the account",
                      "the copy is left as it is");
    if (any)
        keep_();
    return any;
}

// All of the feed, or nothing when it does not lead here. The epoch is asked for behind it, so that
// a tree that is begun anew in between is noticed.
std::optional<account_reader::news> account_reader::read_news(const known_account &known)
{
    news all;
    all.revision = known.revision;
    for (;;) {
        change_block block;
        try {
            block = read_changes(owner_, all.revision, 0);
        } catch (const failure &problem) {
            if (problem.status != parameter_invalid)
                throw;
            return std::nullopt;
        }
        for (const change_info *each : in_order_sent(block.changes.get()))
            all.changes.push_back(change_of(each));
        if (block.revision < all.revision)
            return std::nullopt;
        if (block.revision == all.revision)
            break;
        all.revision = block.revision;
    }
    seen_revision_ = all.revision;
    if (epoch() != known.epoch)
        return std::nullopt;
    return all;
}

void account_reader::fill(known_account &known)
{
    refusals_.clear();
    for (bool more = true; more;) {
        more = false;
        for (const std::string &key : next_unfinished(known)) {
            more = true;
            finish(known, key);
            keep_now_and_then(known);
        }
    }
}

// Listings first, since they describe what the folders hold.
std::vector<std::string> account_reader::next_unfinished(const known_account &known) const
{
    std::vector<std::string> to_list;
    std::vector<std::string> to_describe;
    for (const std::string &key : known.unfinished()) {
        const known_entry &entry = known.entries.at(key);
        if (refusals_.count(key) == 0)
            (entry.is_folder() && !entry.listed ? to_list : to_describe).push_back(key);
    }
    return to_list.empty() ? to_describe : to_list;
}

// What is refused may just have been deleted, which the feed will tell.
void account_reader::finish(known_account &known, const std::string &key)
{
    try {
        known_entry &entry = known.entries.at(key);
        if (entry.is_folder() && !entry.listed)
            list(known, key);
        else
            describe(key, entry);
    } catch (const failure &problem) {
        if (problem.code != exit_code::refused)
            throw;
        failure named = problem;
        named.why = "key:" + key + ": " + problem.why;
        refusals_.emplace(key, named);
    }
}

void account_reader::describe(const std::string &key, known_entry &entry)
{
    const known_entry read = entry.is_folder()
                                 ? known_entry_of(read_folder(owner_, key.c_str()).get())
                                 : known_entry_of(read_file(owner_, key).get());
    entry.name = read.name;
    entry.content = read.content;
    entry.described = true;
}

void account_reader::list(known_account &known, const std::string &key)
{
    const folder_content content =
        steady_content({entry_kind::folder, key, known.entries.at(key).name, {}});
    std::vector<std::pair<std::string, known_entry>> found;
    for (const folder_info *each : content.folders)
        found.emplace_back(checked_key(folder_info_get_folderkey(each)), known_entry_of(each));
    for (const file_info *each : content.files)
        found.emplace_back(checked_key(file_info_get_quickkey(each)), known_entry_of(each));
    known.add_listing(key, found);
}

// An entry that leaves a folder while its chunks are read draws another one from a chunk to come
// into one that was read already. The feed has no reason to tell of that one; so a listing of
// several chunks counts when nothing changed meanwhile.
folder_content account_reader::steady_content(const remote_entry &folder)
{
    for (int attempt = 1;; ++attempt) {
        folder_content content =
            read_content(owner_, folder, {entry_kind::folder, entry_kind::file});
        constexpr std::size_t one_of_each = 2;
        if (content.folder_chunks.size() <= one_of_each || attempt == listings_of_a_folder)
            return content;
        const std::uint64_t before = seen_revision_;
        if (device_revision() == before)
            return content;
    }
}

std::uint64_t account_reader::device_revision()
{
    std::int32_t jobs = 0;
    owner_.remote.read("reading the device's status", [&](char **error_message) {
        return get_device_status(owner_.session(), 0, &seen_revision_, &jobs, error_message);
    });
    return seen_revision_;
}

std::string account_reader::epoch()
{
    char *revision = nullptr;
    char *epoch = nullptr;
    owner_.remote.read("reading the revision of the tree", [&](char **error_message) {
        return get_myfiles_revision(owner_.session(), &revision, &epoch, error_message);
    });
    const heap_text owned_revision(revision);
    const heap_text owned_epoch(epoch);
    return text_or_empty(epoch);
}

// The more is known, the longer it takes to write it down.
void account_reader::keep_now_and_then(const known_account &known)
{
    if (++steps_ < steps_between_keeping + known.entries.size() / 10)
        return;
    steps_ = 0;
    keep_();
}

} // namespace quillmere::tools
