#include "media_types.h"

#include <algorithm>
#include <string>

namespace emulator {
namespace {

constexpr media_type known_types[] = {
    {"jpg", "image", "image/jpeg"},
    {"jpeg", "image", "image/jpeg"},
    {"png", "image", "image/png"},
    {"gif", "image", "image/gif"},
    {"bmp", "image", "image/bmp"},
    {"svg", "image", "image/svg+xml"},
    {"tif", "image", "image/tiff"},
    {"tiff", "image", "image/tiff"},
    {"webp", "image", "image/webp"},
    {"mp3", "audio", "audio/mpeg"},
    {"wav", "audio", "audio/x-wav"},
    {"ogg", "audio", "audio/ogg"},
    {"flac", "audio", "audio/flac"},
    {"m4a", "audio", "audio/mp4"},
    {"mp4", "video", "video/mp4"},
    {"m4v", "video", "video/mp4"},
    {"avi", "video", "video/x-msvideo"},
    {"mkv", "video", "video/x-matroska"},
    {"mov", "video", "video/quicktime"},
    {"webm", "video", "video/webm"},
    {"mpg", "video", "video/mpeg"},
    {"txt", "text", "text/plain"},
    {"md", "text", "text/markdown"},
    {"csv", "text", "text/csv"},
    {"html", "text", "text/html"},
    {"xml", "text", "text/xml"},
    {"json", "text", "application/json"},
    {"pdf", "document", "application/pdf"},
    {"rtf", "document", "application/rtf"},
    {"odt", "document", "application/vnd.oasis.opendocument.text"},
    {"zip", "archive", "application/zip"},
    {"gz", "archive", "application/gzip"},
    {"tar", "archive", "application/x-tar"},
};
constexpr media_type other{"", "other", "application/octet-stream"};

} // namespace

const media_type &media_type_of(std::string_view name)
{
    const std::size_t dot = name.rfind('.');
    if (dot == std::string_view::npos)
        return other;
    std::string extension(name.substr(dot + 1));
    std::transform(extension.begin(), extension.end(), extension.begin(), [](char each) {
        return each >= 'A' && each <= 'Z' ? static_cast<char>(each - 'A' + 'a') : each;
    });
    const auto found =
        std::find_if(std::begin(known_types), std::end(known_types),
                     [&extension](const media_type &row) { return extension == row.extension; });
    return found == std::end(known_types) ? other : *found;
}

} // namespace emulator
