#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <vector>

namespace sorvik::server {

// The server's side of one log-on exchange: takes the client's tokens one by
// one until the client is known or refused.
class ILogOnAcceptor
{
public:
    struct Step
    {
        enum class Kind { Continue, Complete, Failed };
        Kind kind = Kind::Failed;
        std::vector<std::uint8_t> token; // for the client; may be empty
        std::u16string clientName;       // when Complete
        std::string error;               // when Failed
    };

    virtual ~ILogOnAcceptor() = default;
    virtual Step Accept(std::span<const std::uint8_t> token) = 0;
};

} // namespace sorvik::server
