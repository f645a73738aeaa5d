// Draws what is recorded as an SVG: a row for each channel, time to the right.
#include <algorithm>
#include <fstream>
#include <iterator>
#include <map>
#include <sstream>

#include "listing.h"
#include "output_file.h"

namespace clips {
namespace {

constexpr double kLeft = 90, kTop = 60, kWidth = 1000, kRow = 26, kBar = 18;
constexpr const char *kRecorded = "#7aa6c2", *kNoIndex = "#c9d6de", *kMotion = "#e8872b", *kGap = "#c0392b";

class Drawing {
 public:
  explicit Drawing(const Stretch &span) : span_(span) {}

  double x(Milliseconds time) const {
    return kLeft +
           kWidth * static_cast<double>(time - span_.from) / static_cast<double>(span_.to - span_.from);
  }
  void bar(const Stretch &stretch, double y, double height, const char *colour, const std::string &title) {
    out_ << "<rect x='" << x(stretch.from) << "' y='" << y << "' width='"
         << std::max(1.0, x(stretch.to) - x(stretch.from)) << "' height='" << height << "' fill='" << colour
         << "'><title>" << title << "</title></rect>\n";
  }
  void text(double at_x, double y, const char *anchor, const std::string &content) {
    out_ << "<text x='" << at_x << "' y='" << y << "' text-anchor='" << anchor << "'>" << content
         << "</text>\n";
  }
  void line(Milliseconds time, double bottom) {
    out_ << "<line x1='" << x(time) << "' x2='" << x(time) << "' y1='" << kTop - 4 << "' y2='" << bottom
         << "' stroke='#dddddd'/>\n";
  }
  std::string content() const { return out_.str(); }

 private:
  Stretch span_;
  std::ostringstream out_;
};

std::string title_of(const Stretch &stretch) {
  return local_text(stretch.from) + " - " + local_text(stretch.to);
}

/// Draws the time axis: at most a dozen lines, at whole hours or days.
void draw_axis(Drawing &drawing, const Stretch &span, double bottom) {
  constexpr Milliseconds kSteps[] = {kHour / 12,      kHour / 4,      kHour,      3 * kHour,
                                     6 * kHour,       24 * kHour,     72 * kHour, 7 * 24 * kHour,
                                     28 * 24 * kHour, 84 * 24 * kHour};
  const auto enough = [&](Milliseconds step) { return (span.to - span.from) / step <= 12; };
  const auto found = std::ranges::find_if(kSteps, enough);
  const Milliseconds step = found == std::end(kSteps) ? *std::prev(found) : *found;
  std::string day;
  // Midnight of the first day, so that the lines are at whole days and hours of the local clock.
  std::tm midnight = recording::local_fields(span.from);
  midnight.tm_hour = midnight.tm_min = midnight.tm_sec = 0;
  for (Milliseconds time = from_local(midnight, Pass::first); time <= span.to; time += step) {
    if (time < span.from) continue;
    const std::string text = local_text(time);
    drawing.line(time, bottom);
    drawing.text(drawing.x(time), kTop - 8, "middle", text.substr(11, 5));
    if (text.substr(0, 10) != day)
      drawing.text(drawing.x(time), kTop - 22, "middle", day = text.substr(0, 10));
  }
}

void draw_row(Drawing &drawing, const ListedRecording &row, double y) {
  const Contents &contents = row.recording.contents;
  const bool known = row.is_known();
  drawing.bar(contents.recorded, y, kBar, known ? kRecorded : kNoIndex,
              title_of(contents.recorded) + (known ? "" : ", no index"));
  for (const Stretch &motion : contents.motion)
    drawing.bar(motion, y + kBar / 2, kBar / 2, kMotion, "motion " + title_of(motion));
  for (const Stretch &gap : contents.gaps) drawing.bar(gap, y - 2, kBar + 4, kGap, "gap " + title_of(gap));
}

void draw_legend(Drawing &drawing, const Stretch &span) {
  double at = kLeft;
  const double width = kWidth / 40;
  for (const auto &[colour, text] :
       {std::pair{kRecorded, "recorded"}, std::pair{kMotion, "motion"}, std::pair{kGap, "gap"},
        std::pair{kNoIndex, "no index: some time in this hour"}}) {
    const auto time = [&](double x) {
      return span.from +
             static_cast<Milliseconds>((x - kLeft) / kWidth * static_cast<double>(span.to - span.from));
    };
    drawing.bar({time(at), time(at + width)}, 8, 12, colour, text);
    drawing.text(at + width + 6, 18, "start", text);
    at += 6 * width;
  }
}

}  // namespace

void draw(const std::vector<ListedRecording> &rows, const std::string &file, bool force) {
  if (rows.empty()) throw std::runtime_error("nothing is recorded there; nothing is drawn");
  Stretch span = rows.front().recording.contents.recorded;
  struct Line {
    std::string name;
    double y;
  };
  std::map<std::pair<bool, unsigned>, Line> lines;  // of each channel and input
  for (const ListedRecording &row : rows) {
    span.from = std::min(span.from, row.recording.contents.recorded.from);
    span.to = std::max(span.to, row.recording.contents.recorded.to);
    lines[{!row.video, row.recording.number}] = {row.name(), 0};
  }
  span.to = std::max(span.to, span.from + 1000);
  double y = kTop;
  Drawing drawing(span);
  const double bottom = kTop + kRow * static_cast<double>(lines.size());
  draw_legend(drawing, span);
  draw_axis(drawing, span, bottom);
  for (auto &[key, line] : lines) {
    line.y = y;
    drawing.text(kLeft - 8, y + kBar - 5, "end", line.name);
    y += kRow;
  }
  for (const ListedRecording &row : rows) draw_row(drawing, row, lines[{!row.video, row.recording.number}].y);

  OutputFile output(file, force);
  std::ofstream stream(output.path());
  stream << "<svg xmlns='http://www.w3.org/2000/svg' width='" << kLeft + kWidth + 40 << "' height='"
         << bottom + 10
         << "' stroke='none' font-family='sans-serif' font-size='12'>\n<rect width='100%' height='100%' "
            "fill='white'/>\n"
         << drawing.content() << "</svg>\n";
  if (!stream.flush()) throw std::runtime_error(file + ": cannot be written");
  output.commit();
}

}  // namespace clips
