// Gallery pictures, the contact sheet and the index page.
#include "tools/gallery.h"

#include <algorithm>
#include <string>
#include <string_view>
#include <vector>

#include "catalog/params.h"
#include "tools/font.h"

namespace fxtool {
namespace {

using fxcat::Settings;
using fxcat::Values;

// Contact-sheet layout: tiles of a thumbnail box over three caption lines (the effect's name and
// up to two lines of settings). Eight columns keep a sheet of 80 or so tiles about as wide as it
// is tall.
constexpr int32_t kThumbWidth = 192;
constexpr int32_t kThumbHeight = 144;
constexpr int32_t kPad = 6;
constexpr int32_t kLineHeight = kGlyphHeight + 3;
constexpr int32_t kTileWidth = kThumbWidth + 2 * kPad;
constexpr int32_t kCaptionLines = 3;
constexpr int32_t kTileHeight = kPad + kThumbHeight + kPad + kCaptionLines * kLineHeight + kPad;
constexpr int32_t kColumns = 8;
constexpr int32_t kHeaderHeight = kPad + kLineHeight + kPad;
constexpr int32_t kCaptionChars = kThumbWidth / kGlyphAdvance;

constexpr uint32_t kBackground = 0xFF1E1E1Eu;
constexpr uint32_t kTitleColour = 0xFFE8E8E8u;
constexpr uint32_t kDetailColour = 0xFFA8A8A8u;

struct Picture {
  std::string file;     // name inside the gallery directory
  std::string title;    // effect name, or "original"
  std::string detail;   // settings, or the source's name and size
  std::string summary;  // the effect's one-line description
  Image thumb;
};

// Scaled to fit the thumbnail box, each output pixel the average of the source pixels it
// covers (one source pixel when enlarging), composited over the sheet's background.
Image thumbnail(const Image& img) {
  int32_t tw = kThumbWidth, th = kThumbHeight;
  if (int64_t{img.width} * kThumbHeight >= int64_t{img.height} * kThumbWidth) {
    th = static_cast<int32_t>(std::max<int64_t>(1, int64_t{img.height} * kThumbWidth / img.width));
  } else {
    tw = static_cast<int32_t>(std::max<int64_t>(1, int64_t{img.width} * kThumbHeight / img.height));
  }
  Image out;
  out.resize(tw, th);
  for (int32_t y = 0; y < th; ++y) {
    const int64_t y0 = int64_t{y} * img.height / th;
    const int64_t y1 = std::max(y0 + 1, int64_t{y + 1} * img.height / th);
    for (int32_t x = 0; x < tw; ++x) {
      const int64_t x0 = int64_t{x} * img.width / tw;
      const int64_t x1 = std::max(x0 + 1, int64_t{x + 1} * img.width / tw);
      uint64_t sum[4] = {0, 0, 0, 0};
      for (int64_t sy = y0; sy < y1; ++sy) {
        for (int64_t sx = x0; sx < x1; ++sx) {
          const uint32_t p = img.at(static_cast<int32_t>(sx), static_cast<int32_t>(sy));
          for (int c = 0; c < 4; ++c) sum[c] += (p >> (8 * c)) & 0xFF;
        }
      }
      const uint64_t n = static_cast<uint64_t>((x1 - x0) * (y1 - y0));
      const uint64_t a = sum[3] / n;
      uint32_t px = 0xFF000000u;
      for (int c = 0; c < 3; ++c) {
        const uint64_t v = sum[c] / n, bg = (kBackground >> (8 * c)) & 0xFF;
        px |= static_cast<uint32_t>((v * a + bg * (255 - a)) / 255) << (8 * c);
      }
      out.at(x, y) = px;
    }
  }
  return out;
}

std::string fit_caption(std::string s) {
  if (static_cast<int32_t>(s.size()) > kCaptionChars) {
    s.resize(static_cast<size_t>(kCaptionChars - 1));
    s += '~';
  }
  return s;
}

// The settings over as many caption lines as are left under the title, broken after a comma
// where one fits, the last line cut short with '~' if even they do not suffice.
std::vector<std::string> wrap_detail(std::string_view s) {
  constexpr size_t kDetailLines = kCaptionLines - 1;
  const size_t width = static_cast<size_t>(kCaptionChars);
  std::vector<std::string> out;
  while (out.size() + 1 < kDetailLines && s.size() > width) {
    const size_t comma = s.substr(0, width).rfind(',');
    const size_t cut = comma == std::string_view::npos ? width : comma + 1;
    out.emplace_back(s.substr(0, cut));
    s.remove_prefix(cut);
  }
  if (!s.empty()) out.push_back(fit_caption(std::string(s)));
  return out;
}

Image contact_sheet(const std::vector<Picture>& pictures, const std::string& heading) {
  const int32_t count = static_cast<int32_t>(pictures.size());
  const int32_t columns = std::min(kColumns, std::max(count, 1));
  const int32_t rows = (count + columns - 1) / columns;
  Image sheet;
  sheet.resize(columns * kTileWidth, kHeaderHeight + rows * kTileHeight);
  std::fill(sheet.pixels.begin(), sheet.pixels.end(), kBackground);
  draw_text(sheet, kPad, kPad, heading, kTitleColour);
  for (int32_t i = 0; i < count; ++i) {
    const Picture& p = pictures[static_cast<size_t>(i)];
    const int32_t left = (i % columns) * kTileWidth + kPad;
    const int32_t top = kHeaderHeight + (i / columns) * kTileHeight + kPad;
    const int32_t ox = left + (kThumbWidth - p.thumb.width) / 2;
    const int32_t oy = top + (kThumbHeight - p.thumb.height) / 2;
    for (int32_t y = 0; y < p.thumb.height; ++y) {
      for (int32_t x = 0; x < p.thumb.width; ++x) sheet.at(ox + x, oy + y) = p.thumb.at(x, y);
    }
    const int32_t text_top = top + kThumbHeight + kPad;
    draw_text(sheet, left, text_top, fit_caption(p.title), kTitleColour);
    int32_t line_top = text_top + kLineHeight;
    for (const std::string& line : wrap_detail(p.detail)) {
      draw_text(sheet, left, line_top, line, kDetailColour);
      line_top += kLineHeight;
    }
  }
  return sheet;
}

std::string html_escape(std::string_view s) {
  std::string out;
  for (char c : s) {
    switch (c) {
      case '&':
        out += "&amp;";
        break;
      case '<':
        out += "&lt;";
        break;
      case '>':
        out += "&gt;";
        break;
      case '"':
        out += "&quot;";
        break;
      default:
        out += c;
    }
  }
  return out;
}

std::string index_page(const std::vector<Picture>& pictures, const std::string& heading) {
  std::string html =
      "<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"utf-8\">\n"
      "<title>" +
      html_escape(heading) +
      "</title>\n<style>\n"
      "body { font-family: sans-serif; background: #1e1e1e; color: #e8e8e8; margin: 2em; }\n"
      "a { color: #9cf; }\n"
      ".grid { display: flex; flex-wrap: wrap; gap: 1.5em; }\n"
      "figure { margin: 0; width: 300px; }\n"
      "figure img { max-width: 300px; max-height: 225px; display: block; }\n"
      "figcaption { margin-top: 0.4em; font-size: 0.9em; }\n"
      "figcaption small { color: #a8a8a8; display: block; }\n"
      "</style>\n</head>\n<body>\n<h1>" +
      html_escape(heading) + "</h1>\n<p><a href=\"contact-sheet.png\">Contact sheet</a></p>\n" +
      "<div class=\"grid\">\n";
  for (const Picture& p : pictures) {
    html += "<figure><a href=\"" + html_escape(p.file) + "\"><img src=\"" + html_escape(p.file) +
            "\" alt=\"" + html_escape(p.title + " " + p.detail) + "\"></a><figcaption><b>" +
            html_escape(p.title) + "</b> " + html_escape(p.detail) + "<small>" +
            html_escape(p.summary) + "</small></figcaption></figure>\n";
  }
  return html + "</div>\n</body>\n</html>\n";
}

// Splits the registry's gallery string into its items.
std::vector<std::string> gallery_items(const char* gallery) {
  std::vector<std::string> items;
  std::string_view rest = gallery;
  while (true) {
    const size_t semi = rest.find(';');
    items.emplace_back(rest.substr(0, semi));
    if (semi == std::string_view::npos) break;
    rest.remove_prefix(semi + 1);
  }
  return items;
}

// Every parameter's value as it was used: "centre=200,half-height=50".
std::string settings_text(const Effect& effect, const Values& values) {
  std::string text;
  for (size_t k = 0; k < effect.param_count(); ++k) {
    if (k > 0) text += ',';
    text.append(effect.params[k].name)
        .append("=")
        .append(fxcat::format_value(effect.params[k], values[k]));
  }
  return text;
}

std::string size_text(const Image& img) {
  return std::to_string(img.width) + "x" + std::to_string(img.height);
}

}  // namespace

std::string picture_name(const Effect& effect, const std::string& settings) {
  std::string name = effect.name;
  if (!settings.empty()) name += '-';
  for (char c : settings) {
    const bool plain = (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '-' || c == '.';
    name += c == '=' || c == ',' ? '-' : plain ? c : '_';
  }
  return name + ".png";
}

std::string make_gallery(const Image& photo, const std::string& source, const std::string& dir,
                         const std::vector<const Effect*>& chosen, int32_t& pictures) {
  pictures = 0;
  std::vector<Picture> shown;
  shown.push_back({"original.png", "original", source + " " + size_text(photo),
                   "the photograph as it is", thumbnail(photo)});
  if (std::string err = write_image(dir + "/original.png", photo); !err.empty()) {
    return dir + "/original.png: " + err;
  }

  for (const Effect* effect : chosen) {
    if (effect->gallery == nullptr) continue;
    for (const std::string& item : gallery_items(effect->gallery)) {
      const std::string label = std::string(effect->name) + (item.empty() ? "" : " " + item);
      Settings settings;
      Values values;
      std::string err = fxcat::parse_settings(*effect, item, settings);
      if (err.empty()) err = fxcat::resolve(*effect, settings, photo.width, photo.height, values);
      Image out;
      if (err.empty()) {
        err = fxcat::output_size(*effect, values, photo.width, photo.height, out.width, out.height);
      }
      if (err.empty()) {
        out.resize(out.width, out.height);
        err = fxcat::run_effect(*effect, values, photo.pixels.data(), photo.width, photo.height,
                                out.pixels.data(), nullptr);
      }
      const std::string file = picture_name(*effect, item);
      if (err.empty()) err = write_image(dir + "/" + file, out);
      if (!err.empty()) return label + ": " + err;
      shown.push_back(
          {file, effect->name, settings_text(*effect, values), effect->summary, thumbnail(out)});
      ++pictures;
    }
  }

  const std::string heading = "photofx gallery: " + source + " " + size_text(photo);
  if (std::string err = write_image(dir + "/contact-sheet.png", contact_sheet(shown, heading));
      !err.empty()) {
    return dir + "/contact-sheet.png: " + err;
  }
  if (std::string err = write_text(dir + "/index.html", index_page(shown, heading)); !err.empty()) {
    return dir + "/index.html: " + err;
  }
  return {};
}

}  // namespace fxtool
