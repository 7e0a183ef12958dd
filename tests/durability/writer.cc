#include "durability/writer.h"

#include <array>
#include <stdexcept>
#include <utility>

#include <openssl/evp.h>

#include "digest.h"
#include "durability/stored_state.h"

namespace {

constexpr std::uint32_t fewest_entries = 12; // below it there would be little to change
constexpr std::uint32_t most_entries = 40;   // beyond it every check would only take longer

using effect = std::function<void(entries &, const std::string &)>;

effect adds(const std::string &kind, const std::string &parent, const std::string &name,
            const std::string &content)
{
    return [=](entries &all, const std::string &made) {
        all[made] = stored_entry(kind, parent, name, content);
    };
}

effect says(const std::string &key, const std::string &what, const std::string &value)
{
    return [=](entries &all, const std::string &) { all.at(key).info[what] = value; };
}

effect moves(const std::string &key, const std::string &parent)
{
    return [=](entries &all, const std::string &) { all.at(key).parent = parent; };
}

void remove_tree(entries &all, const std::string &key)
{
    all.erase(key);
    std::vector<std::string> held;
    for (const auto &[inner, entry] : all)
        if (entry.parent == key)
            held.push_back(inner);
    for (const std::string &inner : held)
        remove_tree(all, inner);
}

effect removes(const std::string &key)
{
    return [=](entries &all, const std::string &) { remove_tree(all, key); };
}

std::string base64(const std::string &bytes)
{
    std::array<unsigned char, 64> text{}; // a digest has 44 digits
    const int length =
        EVP_EncodeBlock(text.data(), reinterpret_cast<const unsigned char *>(bytes.data()),
                        static_cast<int>(bytes.size()));
    return {reinterpret_cast<const char *>(text.data()), static_cast<std::size_t>(length)};
}

// A reply that was cut is none.
bool is_whole(const std::string &reply)
{
    const std::string end = "</response>";
    return reply.size() >= end.size() &&
           reply.compare(reply.size() - end.size(), end.size(), end) == 0;
}

} // namespace

writer::writer(std::string session, std::string root, std::uint32_t seed)
    : session_(std::move(session)), root_(std::move(root)), random_(seed)
{
}

void writer::write(std::uint16_t port, const std::function<void()> &report)
{
    try {
        connection_.emplace(port);
        while (refused_.empty()) {
            pending_ = next_write();
            if (carry_out())
                report();
        }
    } catch (const std::runtime_error &) {
        // The connection is cut: the server is gone.
    }
    connection_.reset();
}

bool writer::carry_out()
{
    const std::string reply = ask(request_of(*pending_));
    const std::string result = element(reply, "result");
    if (result != "Success" && result != "0") {
        refused_ = pending_->action + '?' + pending_->parameters + ": " + reply;
        return false;
    }
    const pending_write made = *std::exchange(pending_, std::nullopt);
    made.effect(acknowledged_,
                made.key_element.empty() ? std::string() : element(reply, made.key_element));
    return true;
}

std::string writer::ask(const std::string &request)
{
    connection_->send(request);
    std::string reply = connection_->read_reply();
    if (!is_whole(reply))
        throw std::runtime_error("cut");
    return reply;
}

std::string writer::request_of(const pending_write &write) const
{
    std::string request = (write.bytes.empty() ? "GET" : "POST") + std::string(" /api/") +
                          write.action + ".php?type=desktop&session_token=" + session_ +
                          write.parameters + " HTTP/1.1\r\nHost: localhost\r\n";
    if (!write.name.empty())
        request += "Content-Disposition: attachment; filename=" + write.name + "\r\n";
    if (!write.bytes.empty())
        request += "Content-Digest: sha-256=:" + base64(emulator::sha256(write.bytes)) +
                   ":\r\nContent-Length: " + std::to_string(write.bytes.size()) + "\r\n";
    return request + "\r\n" + write.bytes;
}

writer::end_of_pending writer::settle(const entries &stored)
{
    const std::optional<pending_write> pending = std::exchange(pending_, std::nullopt);
    if (!pending || stored == acknowledged_)
        return pending ? end_of_pending::not_made : end_of_pending::none;
    std::string made; // its key is known to nobody yet
    for (const auto &[key, entry] : stored)
        if (acknowledged_.count(key) == 0)
            made = key;
    entries with_it = acknowledged_;
    pending->effect(with_it, made);
    if (with_it != stored)
        return end_of_pending::not_made;
    acknowledged_ = std::move(with_it);
    return end_of_pending::made;
}

pending_write writer::next_write()
{
    using maker = pending_write (writer::*)();
    static constexpr maker growing[] = {&writer::create_folder, &writer::create_file,
                                        &writer::upload_file};
    static constexpr maker shrinking[] = {&writer::delete_file, &writer::delete_folder};
    static constexpr maker changing[] = {
        &writer::fill_file,   &writer::revise_file, &writer::rename_file,   &writer::rename_folder,
        &writer::move_file,   &writer::move_folder, &writer::create_folder, &writer::create_file,
        &writer::upload_file, &writer::delete_file};
    if (acknowledged_.size() < fewest_entries)
        return (this->*growing[below(std::size(growing))])();
    if (acknowledged_.size() > most_entries)
        return (this->*shrinking[below(std::size(shrinking))])();
    return (this->*changing[below(std::size(changing))])();
}

pending_write writer::create_folder()
{
    const std::string parent = folder_or_root();
    const std::string name = new_name();
    return {"folder/create", "&parent_key=" + parent + "&foldername=" + name,
            adds("folder", parent, name, ""), "folder_key"};
}

pending_write writer::create_file()
{
    const std::string parent = folder_or_root();
    const std::string name = new_name();
    return {"file/create", "&parent_key=" + parent + "&filename=" + name,
            adds("file", parent, name, no_content), "quickkey"};
}

pending_write writer::upload_file()
{
    const std::string parent = folder_or_root();
    const std::string name = new_name();
    const std::string bytes = new_bytes();
    const auto effect = adds("file", parent, name, hash_of(bytes));
    return {"upload/upload", "&folder_key=" + parent, effect, "key", bytes, name};
}

pending_write writer::fill_file()
{
    const std::string key = one_of(keys_with("content", no_content));
    if (key.empty())
        return create_file();
    const std::string bytes = new_bytes();
    const auto effect = says(key, "content", hash_of(bytes));
    return {"upload/upload", "&uploadkey=" + key, effect, {}, bytes};
}

pending_write writer::revise_file()
{
    const std::string key = file();
    if (key.empty())
        return upload_file();
    const std::string description =
        ask("GET /api/file/get_info.php?session_token=" + session_ + "&quick_key=" + key +
            " HTTP/1.1\r\nHost: localhost\r\n\r\n");
    const std::string bytes = new_bytes();
    const std::string hash = hash_of(bytes);
    const std::string parameters =
        "&quickkey=" + key + "&revision=" + element(description, "revision") +
        "&target_hash=" + hash + "&target_size=" + std::to_string(bytes.size());
    return {"upload/upload", parameters, says(key, "content", hash), {}, bytes};
}

pending_write writer::rename_file()
{
    const std::string key = file();
    const std::string name = new_name();
    if (key.empty())
        return create_file();
    return {"file/update", "&quick_key=" + key + "&filename=" + name, says(key, "name", name)};
}

pending_write writer::rename_folder()
{
    const std::string key = folder();
    const std::string name = new_name();
    if (key.empty())
        return create_folder();
    return {"folder/update", "&folder_key=" + key + "&foldername=" + name, says(key, "name", name)};
}

pending_write writer::move_file()
{
    const std::string key = file();
    const std::string parent = folder_or_root();
    if (key.empty() || acknowledged_.at(key).parent == parent)
        return create_file();
    return {"file/move", "&quick_key=" + key + "&folder_key=" + parent, moves(key, parent)};
}

pending_write writer::move_folder()
{
    const std::string key = folder();
    const std::string parent = folder_or_root();
    if (key.empty() || acknowledged_.at(key).parent == parent || lies_within(parent, key))
        return create_folder();
    return {"folder/move", "&folder_key_src=" + key + "&folder_key_dst=" + parent,
            moves(key, parent)};
}

pending_write writer::delete_file()
{
    const std::string key = file();
    if (key.empty())
        return upload_file();
    return {"file/delete", "&quick_key=" + key, removes(key)};
}

pending_write writer::delete_folder()
{
    const std::string key = folder();
    if (key.empty())
        return delete_file();
    return {"folder/delete", "&folder_key=" + key, removes(key)};
}

std::uint32_t writer::below(std::uint32_t end)
{
    return static_cast<std::uint32_t>(random_() % end);
}

std::vector<std::string> writer::keys_with(const std::string &what, const std::string &value) const
{
    std::vector<std::string> keys;
    for (const auto &[key, entry] : acknowledged_)
        if (entry.info.at(what) == value)
            keys.push_back(key);
    return keys;
}

std::string writer::one_of(const std::vector<std::string> &keys)
{
    return keys.empty() ? "" : keys[below(static_cast<std::uint32_t>(keys.size()))];
}

std::string writer::folder_or_root()
{
    const std::string key = below(3) == 0 ? "" : folder();
    return key.empty() ? root_ : key;
}

std::string writer::new_name() { return "n" + std::to_string(++names_); }

// Different from all that were there before, so that each is a content of its own.
std::string writer::new_bytes()
{
    std::string bytes = session_ + new_name();
    bytes.append(below(60'000), static_cast<char>(below(256)));
    return bytes;
}

bool writer::lies_within(std::string folder, const std::string &other) const
{
    while (folder != other && folder != root_)
        folder = acknowledged_.at(folder).parent;
    return folder == other;
}
