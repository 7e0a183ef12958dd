// The operations on an account in the form in which the tests want them: each call with its inputs
// alone, and everything that came out of it in one value.
#pragma once

#include <cstdint>
#include <optional>
#include <ostream>
#include <string>

#include "quillmere.h"

namespace quillmere_test {

// The results beside status and message are written as "name=value", with NULL for a missing text.
// All out-parameters hold rubbish before a call; a result that still does so reads "untouched".
struct call_outcome {
    int32_t status;
    std::optional<std::string> message;
    std::string results;
};

inline bool operator==(const call_outcome &left, const call_outcome &right)
{
    return left.status == right.status && left.message == right.message &&
           left.results == right.results;
}

std::ostream &operator<<(std::ostream &stream, const call_outcome &outcome);

call_outcome user_info_call(const char *token);
call_outcome user_limits_call(const char *token);
call_outcome myfiles_revision_call(const char *token);

call_outcome folder_info_call(const char *token, const char *folder_key, const char *device_id,
                              const char *details);
call_outcome create_folder_call(const char *token, const char *name, const char *parent_key,
                                const char *mtime);
call_outcome delete_folder_call(const char *token, const char *folder_key);
call_outcome update_folder_call(const char *token, const char *folder_key, const char *name,
                                const char *description, const char *tags, int32_t privacy,
                                int32_t recursive, const char *mtime);
call_outcome copy_folder_call(const char *token, const char *source, const char *destination);
call_outcome move_folder_call(const char *token, const char *source, const char *destination);

call_outcome folder_content_call(const char *token, const char *folder_key, const char *device_id,
                                 const char *chunk, const char *content_type);
call_outcome attach_foreign_call(const char *token, const char *folder_key);
call_outcome detach_foreign_call(const char *token, const char *folder_key);

call_outcome file_info_call(const char *quick_key, const char *token);
call_outcome create_file_call(const char *token, const char *name, const char *extension,
                              const char *parent_key, const char *mtime);
call_outcome delete_file_call(const char *token, const char *quick_key);
call_outcome copy_file_call(const char *token, const char *quick_key, const char *folder_key);
call_outcome move_file_call(const char *token, const char *quick_key, const char *folder_key);

call_outcome links_call(const char *quick_key, const char *link_type, const char *token);
call_outcome download_link_call(const char *token, const char *quick_key);

// After QM_MALFORMED_REPLY a list that was made reads "changes=deleted", and is not looked at.
call_outcome device_changes_call(const char *token, uint64_t revision, uint32_t device_id);
call_outcome sample_changes_call(const char *token, uint64_t revision, uint32_t device_id);

} // namespace quillmere_test
