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

constexpr int kMostDoomedFiles = 256;

// From now on a signal that ends the program removes that file first. The string must live until
// spare_file(), and stay where it is. At most kMostDoomedFiles at a time, on any threads.
void doom_file(const std::string& path);
void spare_file(const std::string& path);

}  // namespace tool
