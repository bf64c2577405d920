// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stdexcept>
#include <string>

namespace Ostrand {

/// A null reference where an interface is demanded.
class NullInterfaceException : public std::runtime_error {
public:
    NullInterfaceException() : std::runtime_error("null interface") {}
};

/// An input contract that doesn't hold; carries the condition and the source that stated it.
class ContractException : public std::logic_error {
public:
    ContractException(const std::string& message, std::string condition, std::string source)
        : std::logic_error(message), mCondition(std::move(condition)), mSource(std::move(source)) {}

    [[nodiscard]] const std::string& GetCondition() const { return mCondition; }
    [[nodiscard]] const std::string& GetSource() const { return mSource; }

private:
    std::string mCondition;
    std::string mSource;
};

}  // namespace Ostrand
