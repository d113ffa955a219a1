#include "report/HTMLReport.h"

#include <zlib.h>

#include <limits>
#include <optional>
#include <utility>

#include "propertylist/xml/XMLPropertyListScalars.h"
#include "report/ReportPage.h"

namespace accounts {
namespace {

// In JSON a "<" stands only within texts, where its escape means the same. Without one nothing can
// end the element that the JSON stands in, nor begin a comment there.
constexpr char kTagStart = '<';
constexpr std::string_view kEscapedTagStart = "\\u003c";

// Up to here a report stands in its page as a person can read it; a longer one would be too large
// to be sent on.
constexpr std::size_t kLongestPlainReport = std::size_t{4} << 20;

std::string escaped(std::string_view json) {
  std::string text;
  text.reserve(json.size());
  for (const char character : json) {
    if (character == kTagStart) {
      text += kEscapedTagStart;
    } else {
      text += character;
    }
  }
  return text;
}

/// The bytes in the gzip format; none when there is no memory for it or there are too many.
std::optional<std::string> compressed(std::string_view text) {
  constexpr int kGzip = 15 + 16;
  constexpr int kMemoryLevel = 8;
  if (text.size() > std::numeric_limits<uInt>::max()) {
    return std::nullopt;
  }
  z_stream stream{};
  if (deflateInit2(&stream, Z_DEFAULT_COMPRESSION, Z_DEFLATED, kGzip, kMemoryLevel,
                   Z_DEFAULT_STRATEGY) != Z_OK) {
    return std::nullopt;
  }
  std::string bytes(deflateBound(&stream, text.size()), '\0');
  // zlib only reads what it takes for bytes that might be changed.
  stream.next_in = reinterpret_cast<Bytef*>(const_cast<char*>(text.data()));
  stream.avail_in = static_cast<uInt>(text.size());
  stream.next_out = reinterpret_cast<Bytef*>(bytes.data());
  stream.avail_out = static_cast<uInt>(bytes.size());
  const int end = deflate(&stream, Z_FINISH);
  bytes.resize(stream.total_out);
  deflateEnd(&stream);
  return end == Z_STREAM_END ? std::optional(std::move(bytes)) : std::nullopt;
}

std::string element(std::string_view type, std::string_view content) {
  std::string text = "<script type=\"";
  return text.append(type).append("\" id=\"report\">").append(content).append("</script>");
}

}  // namespace

std::string htmlReport(std::string_view reportJSON) {
  const auto bytes =
      reportJSON.size() > kLongestPlainReport ? compressed(reportJSON) : std::nullopt;
  const std::string report = bytes ? element("application/gzip", xmlplist::dataText(*bytes))
                                   : element("application/json", escaped(reportJSON));
  std::string page(reportPage.beforeReport);
  return page.append(report).append(reportPage.afterReport);
}

}  // namespace accounts
