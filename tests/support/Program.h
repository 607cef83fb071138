// Running a program of the build to its end.
#pragma once

#include <string>
#include <vector>

namespace testing_support {

struct Outcome {
    int status = -1;  // -1 for a program that a signal ended or that did not start
    std::string output;
    std::string errors;
};

// Runs a program, in an environment that keeps the user's own home and cache out of it. A name without a
// slash is looked for in PATH.
Outcome runProgram(const std::string& program, std::vector<std::string> arguments);

// vexo, as it was built.
Outcome runVexo(std::vector<std::string> arguments);

// Whether what a program said is one line, with its end.
bool isOneLine(const std::string& text);

}  // namespace testing_support
