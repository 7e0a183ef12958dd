#include "durability/stored_state.h"

#include <stdexcept>

#include <nlohmann/json.hpp>

#include "digest.h"
#include "emulator/process.h"
#include "files.h"
#include "store/database.h"

namespace {

constexpr std::size_t largest_content = 1 << 20;

std::string content_of(const nlohmann::json &file)
{
    const std::string hash = file.at("hash");
    return hash.empty() ? no_content : hash;
}

void add_folder(const nlohmann::json &folder, entries &to)
{
    const std::string parent = folder.at("key");
    for (const nlohmann::json &each : folder.at("files"))
        to[each.at("key")] = stored_entry("file", parent, each.at("name"), content_of(each));
    for (const nlohmann::json &each : folder.at("folders")) {
        to[each.at("key")] = stored_entry("folder", parent, each.at("name"), "");
        add_folder(each, to);
    }
}

stored_account account_in(const nlohmann::json &dumped)
{
    stored_account account{dumped.at("root").at("key"), {}, dumped.at("revision"), 0};
    add_folder(dumped.at("root"), account.tree);
    if (!dumped.at("feed").empty())
        account.newest_in_feed = dumped.at("feed").back().at("revision");
    return account;
}

std::string bytes_at(const std::filesystem::path &path)
{
    return std::filesystem::exists(path) ? emulator::read_file(path, largest_content) : "";
}

} // namespace

account_entry stored_entry(const std::string &kind, const std::string &parent,
                           const std::string &name, const std::string &content)
{
    return {parent, {}, {{"kind", kind}, {"name", name}, {"content", content}}};
}

std::string hash_of(const std::string &bytes)
{
    emulator::sha256_sum sum;
    sum.add(bytes);
    return sum.finish_hex();
}

std::map<std::string, stored_account> stored_accounts(const std::filesystem::path &data)
{
    const finished_process done = run_program({"--data", data.string(), "--dump"});
    if (done.exit_code != 0)
        throw std::runtime_error(done.errors);
    std::map<std::string, stored_account> accounts;
    const nlohmann::json dumped = nlohmann::json::parse(done.output);
    for (const nlohmann::json &each : dumped.at("accounts"))
        accounts.emplace(each.at("email"), account_in(each));
    return accounts;
}

std::string damage_of_store(const std::filesystem::path &data)
{
    emulator::database store(data / "store.sqlite");
    std::string found;
    emulator::statement integrity = store.prepare("PRAGMA integrity_check");
    while (integrity.step())
        found += integrity.text(0) == "ok" ? "" : integrity.text(0) + '\n';
    emulator::statement references = store.prepare("PRAGMA foreign_key_check");
    while (references.step())
        found += "a reference to nothing in " + references.text(0) + '\n';
    return found;
}

std::string damaged_contents(const std::filesystem::path &data)
{
    emulator::database store(data / "store.sqlite");
    std::string found;
    emulator::statement query =
        store.prepare("SELECT DISTINCT hash FROM files WHERE hash != '' AND deleted IS NULL");
    while (query.step()) {
        const std::string hash = query.text(0);
        if (hash_of(bytes_at(data / "content" / hash.substr(0, 2) / hash)) != hash)
            found += hash + '\n';
    }
    return found;
}
