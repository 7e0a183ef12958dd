#include "durability/feed_follower.h"

#include <stdexcept>
#include <vector>

#include "durability/stored_state.h"
#include "emulator/socket_client.h"

namespace {

/** The texts of all elements of this name, in their order. */
std::vector<std::string> parts_of(std::string text, const std::string &name)
{
    const std::string closing = "</" + name + ">";
    std::vector<std::string> parts;
    while (text.find(closing) != std::string::npos) {
        parts.push_back(element(text, name));
        text.erase(0, text.find(closing) + closing.size());
    }
    return parts;
}

} // namespace

void feed_follower::follow(std::uint16_t port)
{
    for (bool is_behind = true; is_behind;) {
        const std::string block =
            get(port, "/api/device/get_changes.php?device_id=0&session_token=" + session_ +
                          "&revision=" + std::to_string(revision_));
        if (element(block, "result") != "Success")
            throw std::runtime_error(block);
        apply(block);
        const std::uint64_t reached = std::stoull(element(block, "device_revision"));
        is_behind = reached != revision_;
        revision_ = reached;
    }
}

void feed_follower::apply(const std::string &block)
{
    const std::string updated = element(block, "updated");
    update(element(updated, "folders"), "folder", "folderkey");
    update(element(updated, "files"), "file", "quickkey");
    remove(element(block, "deleted"));
}

void feed_follower::update(const std::string &list, const std::string &kind,
                           const std::string &key_element)
{
    for (const std::string &each : parts_of(list, kind))
        known_[element(each, key_element)] =
            stored_entry(kind, element(each, "parent_folderkey"), element(each, "filename"), "");
}

void feed_follower::remove(const std::string &deleted)
{
    for (const char *key_element : {"folderkey", "quickkey"})
        for (const std::string &key : parts_of(deleted, key_element))
            known_.erase(key);
}

std::string feed_follower::difference_to(const entries &expected) const
{
    entries told = expected;
    for (auto &[key, entry] : told) {
        entry.info["content"].clear();
        if (entry.info["kind"] == "folder")
            entry.info["name"].clear();
    }
    return difference(known_, told);
}
