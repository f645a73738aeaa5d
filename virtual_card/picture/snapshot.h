/**
 * @file snapshot.h
 * Writes a picture as a file that any viewer opens.
 */
#ifndef VIRTUAL_CARD_SNAPSHOT_H
#define VIRTUAL_CARD_SNAPSHOT_H

#include <string>

#include "picture.h"

namespace virtual_card {

/// Returns the picture as a binary PPM file. Throws std::bad_alloc.
std::string to_ppm(const Picture &picture);

}  // namespace virtual_card

#endif
