/**
 * @file camera.h
 * The picture that the decoder of one channel delivers: the drawn camera, a film, or blue for lost video,
 * with picture properties and privacy mask applied.
 */
#ifndef VIRTUAL_CARD_CAMERA_H
#define VIRTUAL_CARD_CAMERA_H

#include <array>
#include <cstdint>
#include <memory>

#include "card_state.h"
#include "field.h"
#include "film.h"
#include "font.h"
#include "picture.h"
#include "picture_controls.h"

namespace virtual_card {

class Camera {
 public:
  explicit Camera(unsigned channel) : channel_(channel) {}

  /// Takes the settings of the channel. Returns true when they change the picture.
  bool adjust(const CardState &state);
  void show_film(std::shared_ptr<Film> film);
  /// Draws a field, unless it is already drawn. Without a film, it depends only on settings and field.
  void draw(const Field &field);

  const Picture &picture() const { return picture_; }

 private:
  static constexpr std::int64_t kNever = INT64_MIN;

  /// The settings that the picture depends on, without time and film.
  struct Look {
    u32 width = 0;
    u32 lines = 0;
    PictureSettings picture;
    Area mask;
    Scene scene = Scene::moving;
    bool lost = false;

    bool operator==(const Look &) const = default;
  };

  void draw_backdrop();
  void draw_scene();
  void draw_moving(const Field &field);
  void draw_film(const Field &field);

  unsigned channel_;
  Look look_;
  PictureControls controls_;
  Colour ball_colour_{};
  bool backdrop_drawn_ = false;
  Picture backdrop_;  ///< everything that does not move, with properties and mask applied
  Picture picture_;
  std::array<std::int64_t, 2> drawn_{kNever, kNever};  ///< by parity: number of the field drawn last
  std::array<Area, 2> ball_area_{};                    ///< by parity: place of the ball in that field
  std::shared_ptr<Film> film_;
  std::int64_t film_frame_ = -1;
};

}  // namespace virtual_card

#endif
