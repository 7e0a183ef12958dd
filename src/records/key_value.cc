// Pairs of texts, kept in the order in which they were added.
#include <cstdlib>

#include "quillmere.h"
#include "runtime/memory.h"

using namespace quillmere;

key_value *key_value_new(const char *key, const char *value)
{
    auto *pair = allocate_zeroed<key_value>();
    pair->key = string_dup(key);
    pair->value = string_dup(value);
    return pair;
}

key_value *key_value_add(key_value *list, const char *key, const char *value)
{
    if (!list)
        return nullptr;
    while (list->next)
        list = list->next;
    list->next = key_value_new(key, value);
    return list->next;
}

key_value *key_value_get_next_pair(const key_value *pair) { return pair ? pair->next : nullptr; }

const char *key_value_get_key(const key_value *pair)
{
    return pair->key; // deliberately without a test for NULL
}

const char *key_value_get_value(const key_value *pair)
{
    return pair->value; // deliberately without a test for NULL
}

void key_value_delete(key_value *list)
{
    while (list) {
        key_value *next = list->next;
        std::free(list->key);
        std::free(list->value);
        std::free(list);
        list = next;
    }
}
