// The host's boundary around a plug-in's work: nothing that a plug-in raises leaves it.
#pragma once

#include <exception>
#include <functional>
#include <type_traits>

namespace vexo {

// Runs `work`; what it raises is recovered from as below. Answers whether `work` ended without raising, at
// the first or the second run.
bool runGuarded(const std::function<void()>& work);

// The same for work that must not be done twice: a broken archive ends it like any other failure.
bool runGuardedOnce(const std::function<void()>& work);

// What `question` answers, or an empty answer where it raises.
template <typename Question>
std::invoke_result_t<Question> guardedAnswer(const Question& question) {
    std::invoke_result_t<Question> answer{};
    runGuarded([&] { answer = question(); });
    return answer;
}

// Turns a failure of `work` into a warning. When the failure is a broken archive, runs `work` once more with
// broken archives counted as unreadable files, so that one of them doesn't hide the rest of a library.
bool recoverFrom(std::exception_ptr failure, const std::function<void()>& work);

}  // namespace vexo
