// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <csignal>
#include <string>

namespace tool {

// Keeps signals that can be caught from this thread for its own lifetime.
class SignalsBlocked {
public:
    SignalsBlocked();
    ~SignalsBlocked();
    SignalsBlocked(const SignalsBlocked&) = delete;
    SignalsBlocked& operator=(const SignalsBlocked&) = delete;

private:
    sigset_t previous_;
};

// From now on a signal that ends the program removes that file first. One file at a time; the
// string must live until spare_file().
void doom_file(const std::string& path);
void spare_file();

}  // namespace tool
