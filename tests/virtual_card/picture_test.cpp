// For the tests of the picture side: drives an engine, and decodes its frames as a host does.
#include "picture_test.h"

#include <cstdlib>
#include <cstring>

#include "picture/encoded_picture.h"
#include "programs/common/libav.h"
#include "zv_lib/stream_headers.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavutil/imgutils.h>
}

using std::chrono::microseconds;

namespace {

u32 word(const std::vector<u8> &bytes, std::size_t at) {
  u32 value = 0;
  std::memcpy(&value, bytes.data() + at, sizeof(value));
  return value;
}

std::vector<u8> mpeg4_header(card::EncodedSize size) {
  std::vector<u8> header{0,    0,    1,    0,    0,    0,    1,    0x20, 2,    0x48,
                         0x0D, 0x8B, 0xA9, 0x85, 0x16, 0x04, 0x3C, 0x1C, 0x46, 0x0F};
  header[14] = static_cast<u8>(size.width >> 5);
  header[15] = static_cast<u8>((size.width & 0x1F) << 3 | size.height >> 11 | 4);
  header[16] = static_cast<u8>(size.height >> 3);
  header[17] = static_cast<u8>((size.height & 7) << 5 | (size.interlaced ? 0x1C : 0x14));
  return header;
}

std::vector<u8> jpeg_header(u32 width, u32 height) {
  zarvo::JpegHeader header = zarvo::jpeg_header_template();
  zarvo::jpeg_set_sof(header, width, height);
  return {header.begin(), header.end()};
}

/// A decoder that ignores no error.
card::AvPtr<AVCodecContext> open_decoder(AVCodecID id) {
  card::AvPtr<AVCodecContext> decoder(avcodec_alloc_context3(avcodec_find_decoder(id)));
  decoder->err_recognition = AV_EF_EXPLODE | AV_EF_BITSTREAM | AV_EF_BUFFER | AV_EF_CRCCHECK;
  decoder->thread_count = 1;
  decoder->flags |= AV_CODEC_FLAG_LOW_DELAY;
  decoder->sample_rate = 8000;  // for sound
  decoder->bits_per_coded_sample = 3;
  decoder->ch_layout.nb_channels = 1;
  EXPECT_EQ(avcodec_open2(decoder.get(), nullptr, nullptr), 0);
  return decoder;
}

card::AvPtr<AVFrame> decode(AVCodecContext &decoder, std::vector<u8> header, const std::vector<u8> &data) {
  header.insert(header.end(), data.begin(), data.end());
  const card::AvPtr<AVPacket> packet(av_packet_alloc());
  av_new_packet(packet.get(), static_cast<int>(header.size()));
  std::memcpy(packet->data, header.data(), header.size());
  card::AvPtr<AVFrame> frame(av_frame_alloc());
  EXPECT_EQ(avcodec_send_packet(&decoder, packet.get()), 0);
  EXPECT_EQ(avcodec_receive_frame(&decoder, frame.get()), 0) << "a frame does not decode";
  return frame;
}

}  // namespace

bool near(Colour a, Colour b, int tolerance) {
  return std::abs(a.y - b.y) <= tolerance && std::abs(a.cb - b.cb) <= tolerance &&
         std::abs(a.cr - b.cr) <= tolerance;
}

Colour Frame::at(u32 x_percent, u32 y_percent) const {
  const std::size_t x = width * x_percent / 100, y = height * y_percent / 100, size = width * height;
  const std::size_t chroma = size + y / 2 * (width / 2) + x / 2;
  return {samples[y * width + x], samples[chroma], samples[chroma + size / 4]};
}

std::vector<std::int16_t> decode_g726(const std::vector<u8> &bytes) {
  const auto frame = decode(*open_decoder(AV_CODEC_ID_ADPCM_G726), {}, bytes);
  const auto *samples = reinterpret_cast<const std::int16_t *>(frame->data[0]);
  return {samples, samples + frame->nb_samples};
}

void PictureTest::power_up() {
  engine.reset();
  for (card::FrameQueue *queue : {&mpeg4, &mjpeg, &audio}) queue->clear();
  decoders.clear();
  next = 0;
  state = {};
  state.encoding = true;
  for (unsigned i = 0; i < card::kChannels; ++i) {
    state.display.layout.window[i] = {i, i, 0, 0, 0, 0, 0, ZV_WINDOW_ENABLED};
    state.display.routing[i] = i;
  }
}

void PictureTest::encode(unsigned channel, u32 scale_code, u32 interval_code, u32 gop, u32 qp) {
  state.channel[channel].encoder = {scale_code, interval_code, gop, qp, {}, {}, false};
}

void PictureTest::fields(int count) {
  for (const std::int64_t end = next + count; next < end; ++next) {
    const auto passed = card::video_standard(state.standard).duration(next);
    const microseconds wall_time = microseconds(1'700'000'000'000'000) + duration_cast<microseconds>(passed);
    engine.field(state, {state.standard, next, wall_time});
  }
}

std::vector<Frame> PictureTest::take(card::FrameQueue &stream) {
  std::vector<Frame> frames;
  while (const auto ready = stream.pop(microseconds{0})) {
    const std::vector<u8> &area = ready->area;
    Frame &frame = frames.emplace_back();
    card::AvPtr<AVFrame> picture;
    if (&stream == &mpeg4) {
      const auto head = driver::unpacked_head(word(area, 0));
      frame.channel = head.channel;
      frame.intra = head.type == 0;
      frame.microseconds = std::int64_t{word(area, driver::kMpeg4TimeSeconds)} * 1'000'000 +
                           word(area, driver::kMpeg4TimeMicroseconds);
      frame.bytes.assign(area.begin() + driver::kMpeg4DescriptorSize, area.end());
      EXPECT_EQ(head.length, frame.bytes.size());
      auto &decoder = decoders[head.channel];
      if (!decoder) decoder = open_decoder(AV_CODEC_ID_MPEG4);
      const auto size =
          card::encoded_size(state.channel[head.channel].encoder.scale_code, state.width, state.lines());
      picture = decode(*decoder, frame.intra ? mpeg4_header(*size) : std::vector<u8>{}, frame.bytes);
      EXPECT_EQ(frame.intra, picture->pict_type == AV_PICTURE_TYPE_I);
    } else {
      frame.channel = word(area, 0);
      frame.bytes.assign(area.begin() + driver::kMjpegDescriptorSize, area.end());
      picture =
          decode(*open_decoder(AV_CODEC_ID_MJPEG), jpeg_header(word(area, 4), word(area, 8)), frame.bytes);
    }
    frame.width = static_cast<u32>(picture->width);
    frame.height = static_cast<u32>(picture->height);
    frame.interlaced = libav::is_interlaced(*picture);
    frame.samples.resize(std::size_t{frame.width} * frame.height * 3 / 2);
    av_image_copy_to_buffer(frame.samples.data(), static_cast<int>(frame.samples.size()), picture->data,
                            picture->linesize, AV_PIX_FMT_YUV420P, picture->width, picture->height, 1);
  }
  return frames;
}

Frame PictureTest::look(unsigned channel) {
  fields(next % 2 == 0 ? 2 : 1);
  take(mpeg4);
  Frame newest;
  for (Frame &frame : take(mjpeg))
    if (frame.channel == channel) newest = std::move(frame);
  return newest;
}
