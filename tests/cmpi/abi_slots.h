// Where slot k of a CMPI function table sits, from the published arithmetic,
// independent of the header's member names.
#pragma once

#include <cstddef>

namespace cmpitest {

static_assert(sizeof(void*) == 8 || sizeof(void*) == 4, "only x86_64 and i386 are pinned");
constexpr bool kLP64 = sizeof(void*) == 8;
// Picks the x86_64 or the i386 column of a layout table.
constexpr std::size_t col(std::size_t x86_64, std::size_t i386) { return kLP64 ? x86_64 : i386; }

// Tables led by one int (ftVersion): slot k at k pointers.  The broker FT and
// MI tables are led by two ints and a pointer: slot k at 8(k-1) on LP64, 4k on ILP32.
enum Lead { kOneInt, kTwoIntsAndName };
constexpr std::size_t slotOffset(Lead lead, std::size_t k) {
  return lead == kOneInt ? k * sizeof(void*) : col(8 * (k - 1), 4 * k);
}

}  // namespace cmpitest
