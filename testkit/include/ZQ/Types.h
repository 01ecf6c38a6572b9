#pragma once

// The agent's fixed-width numeric names. Uint64 is `unsigned long long` on every machine.
namespace ZQ {

typedef unsigned char Uint8;
typedef unsigned short Uint16;
typedef unsigned int Uint32;
typedef unsigned long long Uint64;
typedef double Real64;

}  // namespace ZQ
