// The program as a function of the test.
#pragma once

#include <functional>
#include <vector>

#include "Program.h"

/// epinspect with these words, the program's name among them, in this process; calls before() when all is ready for it.
inline int runHere(
    std::vector<const char*> words, const std::function<void()>& before = [] {}) {
    const auto count = static_cast<int>(words.size());
    words.push_back(nullptr);
    before();
    return epinspect::runProgram(count, const_cast<char**>(words.data()));
}
