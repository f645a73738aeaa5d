// Writes the clip with libavformat.
#include "muxer.h"

#include <algorithm>

namespace clips {
namespace {

using libav::allocated, libav::checked;

constexpr AVRational kSamples{1, kSampleRate};

}  // namespace

Muxer::Muxer(const std::string &path, const ClipFormat &format)
    : path_(path), packet_(allocated(av_packet_alloc())) {
  checked(avformat_alloc_output_context2(&file_, nullptr, format.mp4 ? "mp4" : "matroska", nullptr), path);
  try {
    add_video(format);
    if (format.audio) add_audio(format.mp4);
    if (format.created) av_dict_set(&file_->metadata, "creation_time", utc_text(*format.created).c_str(), 0);
    av_dict_set(&file_->metadata, "title", format.title.c_str(), 0);
    checked(avio_open(&file_->pb, ("file:" + path).c_str(), AVIO_FLAG_WRITE), path);
    checked(avformat_write_header(file_, nullptr), path);
  } catch (...) {
    avio_closep(&file_->pb);
    avformat_free_context(file_);
    throw;
  }
}

Muxer::~Muxer() {
  avio_closep(&file_->pb);
  avformat_free_context(file_);
}

void Muxer::add_video(const ClipFormat &format) {
  const VideoFormat &video = format.video;
  video_ = allocated(avformat_new_stream(file_, nullptr));
  AVRational rate{};
  av_reduce(&rate.num, &rate.den, video.rate.numerator, video.rate.denominator, 1 << 30);
  period_ = av_inv_q(rate);
  video_->time_base = period_;
  video_->avg_frame_rate = video_->r_frame_rate = rate;
  AVCodecParameters &codec = *video_->codecpar;
  codec.codec_type = AVMEDIA_TYPE_VIDEO;
  codec.codec_id = video.codec == VIDEO_CODEC_ZV_MJPEG ? AV_CODEC_ID_MJPEG : AV_CODEC_ID_MPEG4;
  codec.width = video.width;
  codec.height = video.height;
  // Every picture fills 4:3, whatever its size in pixels.
  av_reduce(&codec.sample_aspect_ratio.num, &codec.sample_aspect_ratio.den, 4 * video.height, 3 * video.width,
            1 << 30);
  video_->sample_aspect_ratio = codec.sample_aspect_ratio;
  const std::vector<std::uint8_t> &header = format.stream_header;
  if (!header.empty()) {
    codec.extradata =
        static_cast<std::uint8_t *>(allocated(av_mallocz(header.size() + AV_INPUT_BUFFER_PADDING_SIZE)));
    codec.extradata_size = static_cast<int>(header.size());
    std::ranges::copy(header, codec.extradata);
  }
}

void Muxer::add_audio(bool mp4) {
  audio_ = allocated(avformat_new_stream(file_, nullptr));
  audio_->time_base = kSamples;
  AVCodecParameters &codec = *audio_->codecpar;
  if (mp4) {
    encoder_ = std::make_unique<AacEncoder>([this](AVPacket &packet) { write(packet, audio_, kSamples); });
    checked(avcodec_parameters_from_context(&codec, &encoder_->context()), path_);
    return;
  }
  codec.codec_type = AVMEDIA_TYPE_AUDIO;
  codec.codec_id = AV_CODEC_ID_ADPCM_G726;
  codec.sample_rate = kSampleRate;
  codec.bits_per_coded_sample = kSampleBits;
  codec.bit_rate = kSampleRate * kSampleBits;
  codec.block_align = 1;
  av_channel_layout_default(&codec.ch_layout, 1);
}

void Muxer::write(AVPacket &packet, AVStream *stream, AVRational time_base) {
  packet.stream_index = stream->index;
  av_packet_rescale_ts(&packet, time_base, stream->time_base);
  checked(av_write_frame(file_, &packet), path_);
  checked(file_->pb->error, path_);
}

void Muxer::write_video(std::span<const std::uint8_t> frame, std::int64_t period, bool intra) {
  // The packet borrows the frame: av_write_frame() does not keep it.
  packet_->data = const_cast<std::uint8_t *>(frame.data());
  packet_->size = static_cast<int>(frame.size());
  packet_->pts = packet_->dts = period;
  packet_->duration = 1;
  packet_->flags = intra ? AV_PKT_FLAG_KEY : 0;
  write(*packet_, video_, period_);
}

void Muxer::write_audio(std::span<const std::uint8_t> block, std::int64_t sample) {
  sample = std::max(sample, heard_);
  heard_ = sample + kBlockSamples;
  if (encoder_) return encoder_->add(block, sample);
  packet_->data = const_cast<std::uint8_t *>(block.data());
  packet_->size = static_cast<int>(block.size());
  packet_->pts = packet_->dts = sample;
  packet_->duration = kBlockSamples;
  packet_->flags = AV_PKT_FLAG_KEY;
  write(*packet_, audio_, kSamples);
}

void Muxer::finish() {
  if (encoder_) encoder_->finish();
  checked(av_write_trailer(file_), path_);
  avio_flush(file_->pb);
  checked(file_->pb->error, path_);
}

}  // namespace clips
