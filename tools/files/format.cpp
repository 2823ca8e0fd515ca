#include "files/format.hpp"

#include <algorithm>
#include <cctype>
#include <filesystem>

namespace wavkit::tool {

const std::map<std::string, Format>& formats() {
    static const std::map<std::string, Format> names{
        {"binary", Format::binary}, {"text", Format::text}, {"csv", Format::csv},
        {"wav", Format::wav},       {"flac", Format::flac}, {"npy", Format::npy},
        {"mat", Format::mat},       {"uff", Format::uff},   {"tdms", Format::tdms}};
    return names;
}

const std::map<std::string, Format>& written_formats() {
    static const auto names = [] {
        auto all = formats();
        std::erase_if(all,
                      [](auto& f) { return f.second == Format::uff || f.second == Format::tdms; });
        return all;
    }();
    return names;
}

std::string description(Format format) {
    switch (format) {
        case Format::binary:
            return "binary signal file";
        case Format::text:
            return "text signal file";
        case Format::csv:
            return "CSV";
        case Format::wav:
            return "WAV sound file";
        case Format::flac:
            return "FLAC sound file";
        case Format::npy:
            return "NumPy array";
        case Format::mat:
            return "MATLAB file";
        case Format::uff:
            return "Universal File Format, data sets 58";
        case Format::tdms:
            return "TDMS file";
    }
    return {};
}

std::optional<Format> format_of_name(const std::string& path) {
    static const std::map<std::string, Format> extensions{
        {".dsp", Format::binary}, {".sig", Format::binary}, {".bin", Format::binary},
        {".txt", Format::text},   {".dsa", Format::text},   {".csv", Format::csv},
        {".wav", Format::wav},    {".flac", Format::flac},  {".npy", Format::npy},
        {".mat", Format::mat}};
    auto extension = std::filesystem::path(path).extension().string();
    std::ranges::transform(extension, extension.begin(),
                           [](unsigned char c) { return char(std::tolower(c)); });
    const auto found = extensions.find(extension);
    if (found == extensions.end()) return std::nullopt;
    return found->second;
}

}  // namespace wavkit::tool
