// Configures the card, and starts and ends a recording.
#include "recorder.h"

#include "programs/common/command_line.h"

namespace recorder {
namespace {

Intake *active = nullptr;  // of the recorder that has started; set while no callback runs

void on_video(u32 channel, u8 *data, i32 length, i32 flags) {
  active->take(channel, data, length, flags);
}

void on_audio(u32 input, u8 *data, i32 length, i32 flags) {
  active->take(ZV_CHANNELS + input, data, length, flags);
}

/// A combination that the card cannot encode is a wrong option: no new start mends it.
void check_settings(int status, const char *call) {
  if (status == ZV_ERR_CONFIG)
    throw UsageError(std::string("--channels, --scale, --rate: ") + status_text(status));
  check(status, call);
}

/// The card keeps what an earlier program has set: sets everything that the recording depends on.
void configure(HANDLE card, const Options &options) {
  check(zv_SetVideoStandard(card, options.standard), "zv_SetVideoStandard");
  check(zv_SetResolution(card, options.width), "zv_SetResolution");
  ZV_VIDEO_CONFIG config{};
  config.mjpeg = options.codec;
  config.scale = options.scale;
  config.twofield = options.two_fields ? TWOFIELD_ENABLE : TWOFIELD_DISABLE;
  config.gop = options.gop;
  config.qp = options.qp;
  config.interval = static_cast<ZV_INTERVAL_VALUE>(options.rate);
  config.jpeg_qp = JPEG_QP_ZV_HIGH;
  config.CBRValue = options.bit_rate;
  config.CBREnable = options.bit_rate != 0 ? 1 : 0;
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel)
    if (options.channels >> channel & 1u)
      check_settings(zv_SetVideoEncodeConfig(card, channel, &config), "zv_SetVideoEncodeConfig");
  check_settings(zv_EnableVideoRecordChannels(card, options.channels), "zv_EnableVideoRecordChannels");
  check(zv_EnableAudioChannels(card, options.audio), "zv_EnableAudioChannels");
  check(zv_StartMotionDetection(card), "zv_StartMotionDetection");
}

}  // namespace

Recorder::Recorder(const Options &options)
    : options_(options),
      lock_(options_.root),
      intake_(options_),
      writer_(options_, lock_, intake_, messages_) {
  configure(card_.handle, options_);
}

void Recorder::start() {
  active = &intake_;
  // The card encodes each channel with both codecs; a null callback discards the other codec's frames.
  const bool mpeg4 = options_.codec == VIDEO_CODEC_ZV_MPEG4;
  check(zv_RegisterCallBack(card_.handle, mpeg4 ? on_video : nullptr, mpeg4 ? nullptr : on_video, on_audio),
        "zv_RegisterCallBack");
  writer_.start();
  start_ = Clock::now();
  check(zv_Start(card_.handle), "zv_Start");
}

void Recorder::stop() {
  writer_.note_end();
  zv_Stop(card_.handle);  // from here on no callback runs
  writer_.finish();
}

std::uint64_t Recorder::frames() const {
  std::uint64_t video = 0, audio = 0;
  for (unsigned stream = 0; stream < kStreams; ++stream)
    (is_video(stream) ? video : audio) += intake_.arrivals(stream).frames;
  return options_.channels != 0 ? video : audio;
}

std::uint64_t Recorder::lost() const {
  std::uint64_t sum = 0;
  for (unsigned stream = 0; stream < kStreams; ++stream)
    sum += intake_.arrivals(stream).lost + writer_.dropped(stream);
  return sum;
}

}  // namespace recorder
