#pragma once

// The agent's fixed-width numeric names. Uint64 is `unsigned long long` on every machine; std::uint64_t is another
// type, `unsigned long`, on 64-bit Linux.
namespace ZQ {

using Uint8 = unsigned char;
using Uint16 = unsigned short;
using Uint32 = unsigned int;
using Uint64 = unsigned long long;
using Real64 = double;

}  // namespace ZQ
