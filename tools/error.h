// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <new>
#include <stdexcept>
#include <string>

namespace tool {

// A failure that the user is told about in one line.
class Error : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

// Runs an action whose errors concern the file of that name.
template <class Action>
auto concerning(const std::string& name, Action action) {
    try {
        return action();
    } catch (const Error& error) {
        throw Error(name + ": " + error.what());
    } catch (const std::bad_alloc&) {
        throw Error(name + ": not enough memory");
    }
}

}  // namespace tool
