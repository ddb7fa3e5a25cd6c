// Where picture pixels live. A full-size picture is tens of megabytes, and on the virtual
// machines this program often runs on, first touches of fresh pages cost several times more
// than any effect's arithmetic on them. So large pixel blocks are mapped on their own (asking
// for huge pages, which cuts the faults when fresh memory is needed), and once the program has
// set itself up, freed blocks stay with the process for the next picture of a fitting size
// instead of going back to the system. Opening another picture gives back what no longer fits.
#pragma once

#include <cstddef>

namespace quillane {

// Blocks of at least this many bytes are picture blocks; smaller ones come from the heap.
inline constexpr std::size_t kPictureBlockBytes = std::size_t{1} << 20;

// At most this many freed blocks are kept.
inline constexpr int kKeptPictureBlocks = 6;

// Memory for bytes (> 0) bytes, uninitialised, aligned for any pixel routine. Throws
// std::bad_alloc when there is none.
void* AllocatePictureBytes(std::size_t bytes);

// Gives back memory from AllocatePictureBytes with the same byte count. Null is ignored.
void FreePictureBytes(void* memory, std::size_t bytes) noexcept;

// The start-up set-up of both programs: from now on freed picture blocks are kept (up to
// kKeptPictureBlocks of them, and no more bytes than a quarter of the memory available now, at
// most 1 GiB) for reuse. Without it every freed block goes straight back to the system.
void SetUpPictureMemory();

// Gives back to the system every kept block that a picture of fittingBytes bytes could not use
// (all of them for 0) and whatever the heap holds free, so that the process's resident size
// follows the pictures it holds. For when the document's pictures are replaced.
void ReleasePictureMemory(std::size_t fittingBytes = 0);

// Bytes held in kept (free) blocks now.
std::size_t KeptPictureBytes();

}  // namespace quillane
