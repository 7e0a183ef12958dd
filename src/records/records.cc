// Constructor, getters and destructor of every kind of record, made from its field list.
#include "records/records.h"

#include <cstdlib>

namespace quillmere {

namespace {

// How a field of some type crosses the library's border: a text is copied on the way in and
// borrowed on the way out.
template <class Type> struct crossing {
    using type = Type;
};
template <> struct crossing<char *> {
    using type = const char *;
};
template <class Type> using outside = typename crossing<Type>::type;

char *keep(const char *text) { return string_dup(text); }
uint64_t keep(uint64_t number) { return number; }
int32_t keep(int32_t number) { return number; }

void release(char *text) { std::free(text); }
void release(uint64_t) {}
void release(int32_t) {}

} // namespace

} // namespace quillmere

using namespace quillmere;

// NOLINTBEGIN(bugprone-macro-parentheses): a field's name and type cannot stand in parentheses
// clang-format off
#define COMMA ,
#define ARGUMENT(record, type, name) outside<type> name
#define KEEP(record, type, name) self->name = keep(name);
#define RELEASE(record, type, name) release((*self)->name);
#define GETTER(record, type, name)                        \
    outside<type> record##_get_##name(const record *self) \
    {                                                     \
        return self ? self->name : 0;                     \
    }

#define DEFINE_RECORD(record, FIELDS)                     \
    record *record##_new(FIELDS(ARGUMENT, record, COMMA)) \
    {                                                     \
        auto self = new_record<record>();                 \
        FIELDS(KEEP, record, NOTHING)                     \
        return self.release();                            \
    }                                                     \
    FIELDS(GETTER, record, NOTHING)                       \
    void record##_delete(record **self)                   \
    {                                                     \
        if (!self || !*self)                              \
            return;                                       \
        FIELDS(RELEASE, record, NOTHING)                  \
        std::free(*self);                                 \
    }
// clang-format on
// NOLINTEND(bugprone-macro-parentheses)

DEFINE_RECORD(file_info, FILE_INFO_FIELDS)
DEFINE_RECORD(folder_info, FOLDER_INFO_FIELDS)
DEFINE_RECORD(user_info, USER_INFO_FIELDS)
DEFINE_RECORD(user_limits, USER_LIMITS_FIELDS)
DEFINE_RECORD(system_limits, SYSTEM_LIMITS_FIELDS)
DEFINE_RECORD(system_status, SYSTEM_STATUS_FIELDS)
DEFINE_RECORD(change_info, CHANGE_INFO_FIELDS)
DEFINE_RECORD(file_links, FILE_LINKS_FIELDS)
