/**
 * @file stream_faults.h
 * The faults of a stream: frames that come late, twice, damaged or not at all.
 */
#ifndef VIRTUAL_CARD_STREAM_FAULTS_H
#define VIRTUAL_CARD_STREAM_FAULTS_H

#include <array>
#include <chrono>
#include <optional>
#include <random>
#include <span>

#include "card_state.h"

namespace virtual_card {

enum class StreamKind { mpeg4, mjpeg, audio, preview };
inline constexpr std::size_t kStreamKinds = 4;
inline constexpr std::array<const char *, kStreamKinds> kStreamNames{"mpeg4", "mjpeg", "audio", "preview"};

/// A frame on its way to the host. For the preview, `area` is the index of the buffer.
struct Passing {
  StreamKind stream;
  ReadyFrame frame;
  unsigned copies = 1;  ///< how often the host gets it
};

/// What the faults of a stream remember from frame to frame.
struct FaultMemory {
  std::uint64_t frames = 0;  ///< number of the frame, from 1
  std::minstd_rand random;
  std::optional<u32> frozen;  ///< the preview index that is repeated
};

/// A kind of fault. `hold` returns whether a frame taken from the encoder at `taken` is held back at `now`;
/// `change` changes a frame. A row has one of them, or none: then the stream itself looks at the amount.
struct StreamFaultRow {
  const char *name;
  unsigned streams;    ///< bit n: StreamKind n can have the fault
  const char *amount;  ///< what the number behind the stream means; null: no number
  std::int64_t min;
  std::int64_t max;
  const char *effect;  ///< what the host sees
  bool (*hold)(std::chrono::nanoseconds taken, std::chrono::nanoseconds now, std::int64_t amount);
  void (*change)(Passing &passing, std::int64_t amount, FaultMemory &memory);
};

inline constexpr std::size_t kStreamFaults = 22;
std::span<const StreamFaultRow, kStreamFaults> stream_fault_rows();

/// The faults of one stream, by row; none: off. A fault without a number has the amount 1.
using FaultAmounts = std::array<std::optional<std::int64_t>, kStreamFaults>;

class StreamFaults {
 public:
  explicit StreamFaults(StreamKind stream) : stream_(stream) {}

  void set(const FaultAmounts &amounts, u32 seed);
  bool any() const { return amounts_ != FaultAmounts{}; }
  /// Returns whether no frame comes at all.
  bool stalled() const;
  /// Returns whether frames are held back for a time.
  bool holds() const;
  /// Returns whether a frame that was taken at `taken` is held back at `now`.
  bool held(std::chrono::nanoseconds taken, std::chrono::nanoseconds now) const;
  /// Applies the faults to the next frame. With `copies` 0 the host does not get it.
  void change(Passing &passing);
  /// Returns the frames that the queue holds at most, if that is limited.
  std::optional<std::int64_t> queue_limit() const;

 private:
  StreamKind stream_;
  FaultAmounts amounts_{};
  u32 seed_ = 0;
  FaultMemory memory_;
};

}  // namespace virtual_card

#endif
