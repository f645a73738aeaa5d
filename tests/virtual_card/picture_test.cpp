// Decoders for the streams of the picture side, and its world.
#include "picture_test.h"

#include <cstring>
#include <memory>

#include "zv_lib/stream_headers.h"

extern "C" {
#include <libavcodec/avcodec.h>
}

namespace {

u32 word(const std::vector<u8> &bytes, std::size_t at) {
  u32 value = 0;
  std::memcpy(&value, bytes.data() + at, sizeof(value));
  return value;
}

std::vector<u8> mpeg4_header(u32 width, u32 height, bool interlaced) {
  std::vector<u8> header{0,    0,    1,    0,    0,    0,    1,    0x20, 2,    0x48,
                         0x0D, 0x8B, 0xA9, 0x85, 0x16, 0x04, 0x3C, 0x1C, 0x46, 0x0F};
  header[14] = static_cast<u8>(width >> 5);
  header[15] = static_cast<u8>((width & 0x1F) << 3 | height >> 11 | 4);
  header[16] = static_cast<u8>(height >> 3);
  header[17] = static_cast<u8>((height & 7) << 5 | (interlaced ? 0x1C : 0x14));
  return header;
}

/// A libavcodec decoder that takes no error for a trifle.
class Decoder {
 public:
  explicit Decoder(AVCodecID id) : context_(avcodec_alloc_context3(avcodec_find_decoder(id)), &free_context) {
    context_->err_recognition = AV_EF_EXPLODE | AV_EF_BITSTREAM | AV_EF_BUFFER | AV_EF_CRCCHECK;
    context_->thread_count = 1;
    context_->flags |= AV_CODEC_FLAG_LOW_DELAY;
    context_->sample_rate = 8000;  // for sound
    context_->bits_per_coded_sample = 3;
    context_->ch_layout.nb_channels = 1;
    EXPECT_EQ(avcodec_open2(context_.get(), nullptr, nullptr), 0);
  }
  /// Null when the bytes do not decode.
  const AVFrame *decode(const std::vector<u8> &bytes) {
    AVPacket *packet = av_packet_alloc();
    av_new_packet(packet, static_cast<int>(bytes.size()));
    std::memcpy(packet->data, bytes.data(), bytes.size());
    const int sent = avcodec_send_packet(context_.get(), packet);
    av_packet_free(&packet);
    return sent == 0 && avcodec_receive_frame(context_.get(), frame_.get()) == 0 ? frame_.get() : nullptr;
  }

 private:
  static void free_context(AVCodecContext *context) { avcodec_free_context(&context); }
  static void free_frame(AVFrame *frame) { av_frame_free(&frame); }
  std::unique_ptr<AVCodecContext, decltype(&free_context)> context_;
  std::unique_ptr<AVFrame, decltype(&free_frame)> frame_{av_frame_alloc(), &free_frame};
};

std::vector<u8> plane(const AVFrame &frame, int index) {
  const int shift = index == 0 ? 0 : 1;
  std::vector<u8> samples;
  for (int line = 0; line < frame.height >> shift; ++line) {
    const u8 *const row = frame.data[index] + std::ptrdiff_t{line} * frame.linesize[index];
    samples.insert(samples.end(), row, row + (frame.width >> shift));
  }
  return samples;
}

Decoded to_decoded(const AVFrame *frame) {
  if (frame == nullptr) {
    ADD_FAILURE() << "a frame does not decode";
    return {};
  }
  const auto width = static_cast<u32>(frame->width), height = static_cast<u32>(frame->height);
  const bool intra = frame->pict_type == AV_PICTURE_TYPE_I, interlaced = frame->interlaced_frame != 0;
  return {width, height, intra, interlaced, plane(*frame, 0), plane(*frame, 1), plane(*frame, 2)};
}

}  // namespace

std::vector<Decoded> decode_mpeg4(const std::vector<Encoded> &frames, u32 width, u32 height,
                                  bool interlaced) {
  Decoder decoder(AV_CODEC_ID_MPEG4);
  std::vector<Decoded> pictures;
  for (const Encoded &frame : frames) {
    std::vector<u8> bytes = frame.intra ? mpeg4_header(width, height, interlaced) : std::vector<u8>{};
    bytes.insert(bytes.end(), frame.bytes.begin(), frame.bytes.end());
    pictures.push_back(to_decoded(decoder.decode(bytes)));
  }
  return pictures;
}

Decoded decode_jpeg(const Encoded &frame) {
  Decoder decoder(AV_CODEC_ID_MJPEG);
  zarvo::JpegHeader header = zarvo::jpeg_header_template();
  zarvo::jpeg_set_sof(header, frame.width, frame.height);
  std::vector<u8> bytes(header.begin(), header.end());
  bytes.insert(bytes.end(), frame.bytes.begin(), frame.bytes.end());
  return to_decoded(decoder.decode(bytes));
}

std::vector<std::int16_t> decode_g726(const std::vector<u8> &bytes) {
  Decoder decoder(AV_CODEC_ID_ADPCM_G726);
  const AVFrame *frame = decoder.decode(bytes);
  if (frame == nullptr) return {};
  const auto *samples = reinterpret_cast<const std::int16_t *>(frame->data[0]);
  return {samples, samples + frame->nb_samples};
}

void PictureTest::power_up() {
  engine.reset();
  for (card::FrameQueue *queue : {&mpeg4, &mjpeg, &audio}) queue->clear();
  next = 0;
  state = {};
  state.encoding = true;
  for (unsigned i = 0; i < card::kChannels; ++i) {
    state.display.layout.window[i] = {i, i, 0, 0, 0, 0, 0, ZV_WINDOW_ENABLED};
    state.display.routing[i] = i;
  }
}

void PictureTest::encode(unsigned channel, u32 scale_code, u32 interval_code, u32 gop, u32 qp) {
  card::EncoderSettings &encoder = state.channel[channel].encoder;
  encoder.scale_code = scale_code;
  encoder.interval_code = interval_code;
  encoder.gop = gop;
  encoder.qp = qp;
}

void PictureTest::fields(int count) {
  using std::chrono::microseconds;
  for (const std::int64_t end = next + count; next < end; ++next) {
    const auto passed = card::video_standard(state.standard).duration(next);
    const microseconds wall_time = microseconds(1'700'000'000'000'000) + duration_cast<microseconds>(passed);
    engine.field(state, {state.standard, next, wall_time});
  }
}

std::vector<Encoded> PictureTest::take_mpeg4() {
  std::vector<Encoded> frames;
  while (const auto ready = mpeg4.pop(std::chrono::microseconds{0})) {
    const std::vector<u8> &area = ready->area;
    const auto head = driver::unpacked_head(word(area, 0));
    EXPECT_EQ(head.length, area.size() - driver::kMpeg4DescriptorSize);
    const auto time = std::int64_t{word(area, driver::kMpeg4TimeSeconds)} * 1'000'000 +
                      word(area, driver::kMpeg4TimeMicroseconds);
    const std::vector<u8> bytes(area.begin() + driver::kMpeg4DescriptorSize, area.end());
    frames.push_back({head.channel, head.type == 0, 0, 0, time, bytes});
  }
  return frames;
}

std::vector<Encoded> PictureTest::take_jpeg() {
  std::vector<Encoded> frames;
  while (const auto ready = mjpeg.pop(std::chrono::microseconds{0})) {
    const std::vector<u8> &area = ready->area;
    const std::vector<u8> bytes(area.begin() + driver::kMjpegDescriptorSize, area.end());
    frames.push_back({word(area, 0), true, word(area, 4), word(area, 8), 0, bytes});
  }
  return frames;
}

Decoded PictureTest::look(unsigned channel) {
  fields(next % 2 == 0 ? 2 : 1);
  std::optional<Encoded> newest;
  for (Encoded &frame : take_jpeg())
    if (frame.channel == channel) newest = std::move(frame);
  take_mpeg4();
  return newest ? decode_jpeg(*newest) : Decoded{};
}
