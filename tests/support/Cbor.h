#pragma once

#include <string>

#include <nlohmann/json.hpp>

// As a string: nlohmann/json 3.11 cannot read the vector that its to_cbor returns with libc++ 19, which has no
// std::char_traits<unsigned char>.
inline std::string cborOf(const nlohmann::json& document)
{
    std::string bytes;
    nlohmann::json::to_cbor(document, bytes);
    return bytes;
}
