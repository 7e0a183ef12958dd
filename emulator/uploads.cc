#include "uploads.h"

#include <limits>
#include <set>

#include "caller.h"
#include "endpoints/entries.h"
#include "envelope.h"
#include "header_values.h"
#include "store/content.h"
#include "store/database.h"
#include "store/feed.h"
#include "store/names.h"
#include "store/usage.h"
#include "text.h"

namespace emulator {
namespace {

constexpr std::string_view upload_action = "upload/upload";

/** What a request says of its bytes ahead of them. */
struct announcement {
    std::optional<std::string> name;
    std::set<std::string> hashes; // more than one cannot be kept
    std::optional<std::uint64_t> size;
};

std::string target_hash(const call &asked)
{
    std::string hash;
    for (const char digit : asked.required("target_hash"))
        hash += digit >= 'A' && digit <= 'F' ? static_cast<char>(digit - 'A' + 'a') : digit;
    if (hash.size() != 64 || hash.find_first_not_of("0123456789abcdef") != hash.npos)
        throw refusal(error::parameter_invalid, "target_hash");
    return hash;
}

std::uint64_t number_given(const call &asked, const char *parameter)
{
    const auto number =
        parse_decimal(asked.required(parameter), std::numeric_limits<std::int64_t>::max());
    if (!number)
        throw refusal(error::parameter_invalid, parameter);
    return *number;
}

void read_digest(const char *field, std::string_view value, announcement &said)
{
    if (const auto hash = sha256_in(field, value))
        said.hashes.insert(*hash);
}

void check_announcement(const announcement &said)
{
    if (said.hashes.empty())
        throw refusal(error::parameter_missing, "Content-Digest");
    if (said.hashes.size() > 1)
        throw refusal(error::content_mismatch);
    if (said.size.value_or(0) > upload_size_limit)
        throw refusal(error::request_too_large);
}

announcement announcement_of(const request &asked, const call &made)
{
    announcement said{file_name_in(asked.content_disposition), {}, asked.content_length};
    read_digest("Content-Digest", asked.content_digest, said);
    read_digest("Repr-Digest", asked.repr_digest, said); // the same, since no body is encoded
    if (made.has("quickkey")) {
        said.hashes.insert(target_hash(made));
        const std::uint64_t size = number_given(made, "target_size");
        if (said.size.value_or(size) != size)
            throw refusal(error::content_mismatch);
        said.size = size;
    }
    check_announcement(said);
    return said;
}

file revised_file(const call &asked)
{
    file target = own_file(asked, "quickkey");
    const std::uint64_t current = view_of(asked.state.store, asked.account, target.key).revision;
    if (number_given(asked, "revision") != current)
        throw refusal(error::revision_outdated);
    return target;
}

// The key of an upload is that of its file. One that has its bytes is not to be gone on with.
file begun_file(const call &asked)
{
    file target = own_file(asked, "uploadkey");
    if (!target.content.is_missing())
        throw refusal(error::content_present);
    return target;
}

file new_file_of(const call &asked, const announcement &said)
{
    if (!said.name)
        throw refusal(error::parameter_missing, "Content-Disposition");
    if (!is_xml_text(*said.name))
        throw refusal(error::parameter_invalid, "Content-Disposition");
    check_name(*said.name, "Content-Disposition");
    const std::int64_t now = asked.state.now();
    return create_file(asked.state.store, destination_folder(asked, "folder_key"),
                       {*said.name, now, now});
}

/** Gives the bytes to the file that the request names. Returns its key. */
std::string place(const call &asked, const announcement &said, const content_id &content)
{
    const file target = asked.has("quickkey")    ? revised_file(asked)
                        : asked.has("uploadkey") ? begun_file(asked)
                                                 : new_file_of(asked, said);
    put_content(asked.state.store, target, content, asked.state.now());
    return target.key;
}

reply acceptance(const std::string &key)
{
    xml_writer xml;
    begin_envelope(xml, upload_action);
    xml.element("key", key);
    return {200, end_envelope(xml, "0")};
}

class upload : public body_receiver {
public:
    upload(const request &asked, service &state) : state_(state), origin_(asked.origin)
    {
        guarded([&] { begin(asked); });
        if (asked.method != "POST")
            refused_->fields = {{"Allow", "POST"}};
    }

    void take(std::string_view piece) override
    {
        guarded([&] {
            if (incoming_->size() + piece.size() > said_.size.value_or(upload_size_limit))
                throw refusal(said_.size ? error::content_mismatch : error::request_too_large);
            incoming_->add(piece);
        });
    }

    bool is_refused() const override { return refused_.has_value(); }

    reply answer() override
    {
        reply accepted{};
        guarded([&] { accepted = finish(); });
        return refused_ ? *refused_ : accepted;
    }

private:
    // Nothing is done for a request that was refused.
    void guarded(const std::function<void()> &step)
    {
        if (!refused_)
            refused_ = refusal_of(upload_path, upload_action, step);
    }

    call asked() const { return {state_, given_, account_, origin_}; }

    void begin(const request &head)
    {
        if (head.method != "POST")
            throw refusal(error::method_not_allowed);
        add_form_parameters(split(head.target).query, given_);
        account_ = account_of_session(given_, session_need::required, state_);
        said_ = announcement_of(head, asked());
        rehearse();
        incoming_ = state_.content.receive();
    }

    // Who would be refused at the end is refused before the bytes are sent. Nothing of it stays.
    void rehearse()
    {
        const transaction undone(state_.store);
        place(asked(), said_, {*said_.hashes.begin(), said_.size.value_or(0)});
    }

    reply finish()
    {
        const content_id content = incoming_->finish();
        if (content.hash != *said_.hashes.begin() ||
            content.size != said_.size.value_or(content.size))
            throw refusal(error::content_mismatch);
        transaction whole(state_.store);
        const std::string key = place(asked(), said_, content);
        incoming_->keep(content); // under the lock, so that no reset takes it for unused
        whole.commit();
        return acceptance(key);
    }

    service &state_;
    std::string origin_;
    parameters given_;
    std::int64_t account_ = 0;
    announcement said_;
    std::unique_ptr<incoming_content> incoming_;
    std::optional<reply> refused_;
};

} // namespace

std::unique_ptr<body_receiver> receive_upload(const request &asked, service &state)
{
    if (split(asked.target).path != upload_path)
        return nullptr;
    return std::make_unique<upload>(asked, state);
}

} // namespace emulator
