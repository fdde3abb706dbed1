// Large blocks of memory that the system holds only as far as they are used.
#pragma once

#include <span>

namespace vexa {

/// Gives the whole pages inside `block` back to the system until they are written again; their bytes are lost, the
/// block stays its owner's. False when the system keeps them (memory that the host has locked, say). For memory of
/// one's own from malloc or array new.
bool give_pages_back(std::span<unsigned char> block);

/// Makes every byte of `block` 0 without bringing its pages into memory, where the system can do that.
void clear_untouched(std::span<unsigned char> block);

}  // namespace vexa
