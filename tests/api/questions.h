// Operations that each ask with a number of their own, and a service whose answers tell which
// question they belong to: an answer that went to another thread is found out.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

#include "support/http_message.h"

namespace quillmere_test {

// The service. Any number of threads may call it.
std::string answer_to(const request &asked);

std::string refusal(const std::string &number, const std::string &message);

// Asks, and says whether the answer belongs to the question.
using question = bool (*)(uint32_t number);

constexpr size_t question_count = 12;
extern const question questions[question_count];

// So many questions of each kind in turn, with numbers that no other thread asks with: how many
// answers were wrong.
unsigned wrong_answers(unsigned thread, unsigned rounds);

// The same on so many threads at once.
unsigned wrong_answers_of_threads(unsigned thread_count, unsigned rounds);

} // namespace quillmere_test
