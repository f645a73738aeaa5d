/**
 * @file png_file.h
 * Writes pictures as PNG files.
 */
#ifndef CARD_PNG_FILE_H
#define CARD_PNG_FILE_H

#include <string>

namespace card {

/// Writes a binary PPM picture as a PNG file. Returns false when the file cannot be written.
bool write_png(const std::string &ppm, const std::string &path);

}  // namespace card

#endif
