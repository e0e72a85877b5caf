// Helpers of the reliability suites: runs in forked processes (a fresh library
// each), and a record of everything the game's closures were told.
#pragma once

#include "tarnwick_test.h"

#include <functional>
#include <map>
#include <set>
#include <string>
#include <vector>

namespace tw {

// Test failures recorded in this process so far (a forked run's own show in
// its exit status).
void count_failures();
int failure_count();

struct ChildRun {
    int status = 0;
    std::string output;  // what the body returned
    bool clean() const;
    std::string describe() const;
};

// Runs `body` in a forked process, in a temporary directory of its own (its
// argument), and waits for it. The child exits through exit(), so that the
// sanitized build's leak check runs, with a non-zero status when a test
// assertion failed in it.
ChildRun run_forked(const std::function<std::string(const std::string &dir)> &body);

// The arguments of one closure call as text: i32 in decimal, bytes quoted or
// null, arrays with their records' fields. Arrays must be read during the call.
std::string render_call(const host::Call &call);

// What the game's closures were told, closure by closure, in call order.
using Told = std::map<std::string, std::vector<std::string>>;
std::string show(const Told &told);

class Recorder {
public:
    // A closure whose calls are recorded under `name`. It is not held: the
    // library must keep it alive while it is in flight.
    host::ClosureRef closure(const std::string &name, const std::string &signature);

    Told told;
    std::set<std::string> heard;  // every bytes value any closure received
};

std::string replace_all(std::string text, const std::string &from, const std::string &to);

}  // namespace tw
