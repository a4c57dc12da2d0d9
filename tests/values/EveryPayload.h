// A stream whose values have payloads of every sort.

#pragma once

#include "tests/support/StreamBuilder.h"

namespace oxmv::test {

// A text of each kind of payload, one that is not UTF-8 among them, data, lists and a dictionary.
inline const Bytes ofEveryPayload = {'R', 'E', 'E', 'L',  4,  0, 0, 'c', 'A', '0', '1',  0,     //
                                     'L', 'O', 'O', 'K',  4,  0, 0, 'c', 'C', 'a', 'f',  0xE9,  //
                                     'F', 'R', 'E', 'E',  4,  0, 0, 'c', 1,   2,   3,    4,     //
                                     'D', 'A', 'S', 'F',  8,  0, 0, 'f', 0,   0,   0x80, 0x3F,  //
                                     0,   0,   0,   0x40,                                       //
                                     'K', 'W', 'R', 'd',  4,  0, 0, 'c', 'n', 'o', 'o',  'n',   //
                                     'K', 'W', 'R', 'd',  4,  0, 0, 'c', 'C', 'a', 'f',  0xE9,  //
                                     'C', 'O', 'L', '1',  12, 0, 0, 0,                          //
                                     'T', 'A', 'P', 'E',  4,  0, 0, 'c', 'B', '0', '2',  0,     //
                                     'T', 'A', 'K', 'E',  4,  0, 0, 'B', 7,   0,   0,    0};

}  // namespace oxmv::test
