/**
 * @file driver_capture.h
 * What reads of the nodes return, as a driver's author sees it: descriptors, results and errors.
 */
#ifndef CONTRACT_DRIVER_CAPTURE_H
#define CONTRACT_DRIVER_CAPTURE_H

#include <vector>

#include "driver_nodes.h"

namespace contract {

struct Mpeg4Read {
  double time;  ///< seconds of the monotonic clock
  double wall;  ///< seconds of the wall clock
  long result;
  driver::Mpeg4Head head;
  double stamp;      ///< seconds of the wall clock, as the card says
  u32 picture_type;  ///< as the bitstream says: 0 intra, 1 predicted, 4 no picture
};

struct MjpegRead {
  double time;
  long result;
  driver::MjpegDescriptor descriptor;
  bool ends_with_eoi;  ///< the last byte 0xD9 follows a 0xFF
};

/// Return what the stream region says behind a read that has returned data.
Mpeg4Read mpeg4_read(const u8 *region, long result);
MjpegRead mjpeg_read(const u8 *region, long result);

struct OtherRead {
  double time;
  long result;
  u32 index;  ///< of a preview buffer
};

struct DriverCapture {
  double start = 0, end = 0;  ///< of the encoding
  u32 channels = 0;
  std::vector<Mpeg4Read> mpeg4;
  std::vector<MjpegRead> mjpeg;
  std::vector<OtherRead> audio;
  std::vector<OtherRead> preview;
  std::array<int, 4> errors{};  ///< last error of the reads of MPEG-4, Motion JPEG, audio and preview
};

struct CaptureSetup {
  u32 channels;  ///< CIF at the full rate
  double seconds;
  double pause;  ///< the host reads nothing for this time, half a second after the start
};

/// Encodes NTSC, 720 pixels wide, and reads. Leaves both set, and puts the encoders' settings as the SDK
/// leaves them when it stops. Throws Interrupted.
DriverCapture capture_at_driver(const Nodes &nodes, const CaptureSetup &setup);

}  // namespace contract

#endif
