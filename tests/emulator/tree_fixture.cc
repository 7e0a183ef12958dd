#include "tree_fixture.h"

#include <stdexcept>

#include <fcntl.h>
#include <unistd.h>

#include "files.h"
#include "socket_client.h"
#include "store/accounts.h"
#include "store/file_entries.h"
#include "store/sessions.h"

using namespace emulator;

const std::string Tree::ann = "ann@example.org";
const std::string Tree::bob = "bob@example.org";
const std::string Tree::nobody;

namespace {

std::string encoded(const std::string &text)
{
    static constexpr char digits[] = "0123456789ABCDEF";
    std::string escapes;
    for (const char byte : text) {
        const auto value = static_cast<unsigned char>(byte);
        escapes.append("%").append(1, digits[value >> 4]).append(1, digits[value & 0xF]);
    }
    return escapes;
}

} // namespace

std::vector<std::string> elements(const std::string &reply, const std::string &name)
{
    const std::string opening = "<" + name + ">";
    const std::string closing = "</" + name + ">";
    std::vector<std::string> all;
    for (std::size_t at = 0; (at = reply.find(opening, at)) != std::string::npos;) {
        at += opening.size();
        const std::size_t end = reply.find(closing, at);
        all.push_back(reply.substr(at, end - at));
        at = end;
    }
    return all;
}

Tree::Tree()
{
    // A power cut is no part of these tests, and thousands of changes need not wait for the disk.
    store.execute("PRAGMA synchronous = OFF");
    for (const std::string &who : {ann, bob}) {
        const auto account = add_account(store, {who, "password", {}}, time);
        sessions[who] = open_session(store, account.value(), {time, state.session_lifetime});
    }
}

reply Tree::ask(const std::string &who, const std::string &action, const pairs &given)
{
    std::string target = "/api/" + action + ".php?version=2";
    if (!who.empty())
        target += "&session_token=" + sessions.at(who);
    for (const auto &[name, value] : given)
        target += "&" + name + "=" + encoded(value);
    return answer({"GET", target, {}, {}, "http://localhost:80"}, state);
}

reply Tree::fetch(const std::string &target, const std::string &range, const std::string &if_range,
                  const std::string &method)
{
    return answer({method, target, {}, {}, "http://localhost:80", range, if_range}, state);
}

std::string Tree::error_of(const std::string &who, const std::string &action, const pairs &given)
{
    return element(ask(who, action, given).body, "error");
}

std::string Tree::done(const std::string &who, const std::string &action, const pairs &given,
                       const std::string &name)
{
    const reply made = ask(who, action, given);
    EXPECT_EQ(made.http_status, 200u) << action << made.body;
    return element(made.body, name);
}

std::string Tree::make_folder(const std::string &name, const std::string &parent,
                              const std::string &who)
{
    return done(who, "folder/create", {{"foldername", name}, {"parent_key", parent}}, "folder_key");
}

std::string Tree::make_file(const std::string &name, const std::string &folder,
                            const std::string &who)
{
    return done(who, "file/create", {{"filename", name}, {"parent_key", folder}}, "quickkey");
}

void Tree::fill(const std::string &quick_key, const std::string &bytes)
{
    const std::filesystem::path from = scratch.path() / "bytes";
    write_file(from, bytes, 0600);
    const descriptor opened(::open(from.c_str(), O_RDONLY | O_CLOEXEC));
    const content_id kept = content.keep(opened.number(), 1 << 30);
    transaction change(store);
    put_content(store, find_file(store, quick_key).value(), kept, time);
    change.commit();
}

std::string Tree::root(const std::string &who) { return folder_says("", "folderkey", who); }

std::string Tree::folder_says(const std::string &key, const std::string &name,
                              const std::string &who)
{
    return done(who, "folder/get_info", {{"folder_key", key}}, name);
}

std::string Tree::file_says(const std::string &key, const std::string &name, const std::string &who)
{
    return done(who, "file/get_info", {{"quick_key", key}}, name);
}

std::vector<std::string> Tree::names_in(const std::string &folder, const std::string &who)
{
    const std::string body = ask(who, "1.0/folder/get_content", {{"folder_key", folder}}).body;
    std::vector<std::string> names = elements(body, "name");
    for (const std::string &name : elements(body, "filename"))
        names.push_back(name);
    return names;
}

std::uint64_t Tree::revision(const std::string &who)
{
    return std::stoull(done(who, "user/myfiles_revision", {}, "revision"));
}

std::string path_of(const std::string &link) { return link.substr(link.find('/', 8)); }

std::string bytes_of(const reply &made)
{
    if (!made.file)
        return made.body;
    std::string bytes(made.file->length, '\0');
    const ssize_t got = ::pread(made.file->file->number(), bytes.data(), bytes.size(),
                                static_cast<off_t>(made.file->offset));
    if (got != static_cast<ssize_t>(bytes.size()))
        throw std::runtime_error("the file is too short");
    return bytes;
}

std::string field_of(const reply &made, const std::string &name)
{
    for (const header_field &each : made.fields)
        if (each.name == name)
            return each.value;
    return {};
}
