/**
 * @file picture_controls.h
 * Hue, saturation, contrast and brightness of a decoder, from its registers.
 */
#ifndef VIRTUAL_CARD_PICTURE_CONTROLS_H
#define VIRTUAL_CARD_PICTURE_CONTROLS_H

#include <array>

#include "card_state.h"
#include "picture.h"

namespace virtual_card {

class PictureControls {
 public:
  PictureControls() = default;
  explicit PictureControls(const PictureSettings &settings);

  Colour apply(Colour colour) const;
  void apply(Picture &picture) const;

 private:
  bool luma_neutral_ = true;
  bool chroma_neutral_ = true;
  std::array<u8, 256> luma_{};
  int cosine_ = 256;
  int sine_ = 0;
};

}  // namespace virtual_card

#endif
