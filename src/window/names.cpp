// Window identifiers to text and back.
#include <algorithm>
#include <cstring>
#include <string_view>

#include "window/catalogue.hpp"

namespace wavkit {
namespace {

constexpr std::string_view enumerator_prefix = "DSP_WINDOW_";

/// Names are plain ASCII; a host's locale has no say in their case.
constexpr char lowered(char c) { return c >= 'A' && c <= 'Z' ? char(c - 'A' + 'a') : c; }

bool same_but_for_case(std::string_view a, std::string_view b) {
    return std::ranges::equal(a, b, {}, lowered, lowered);
}

int window_to_str(int window, char* buf, int len) {
    if (!buf || len < 1) return -1;
    const auto names = window_names();
    const auto found = std::ranges::find(names, window, &WindowName::window);
    if (found == names.end()) {
        buf[0] = '\0';
        return -1;
    }
    std::strncpy(buf, found->text, std::size_t(len));
    buf[len - 1] = '\0';
    return 0;
}

int window_from_str(const char* name, int* window) {
    if (!name || !window) return -1;
    std::string_view text = name;
    // An enumerator is called DSP_WINDOW_ and a display name.
    if (same_but_for_case(text.substr(0, enumerator_prefix.size()), enumerator_prefix)) {
        text.remove_prefix(enumerator_prefix.size());
    }
    for (const WindowName& known : window_names()) {
        if (!same_but_for_case(text, known.text)) continue;
        *window = known.window;
        return 0;
    }
    *window = DSP_WINDOW_UNIFORM;
    return -1;
}

}  // namespace
}  // namespace wavkit

int dsp_window_to_str(int window, char* buf, int len) {
    return wavkit::window_to_str(window, buf, len);
}
int dspf_window_to_str(int window, char* buf, int len) {
    return wavkit::window_to_str(window, buf, len);
}

int dsp_window_from_str(const char* name, int* window) {
    return wavkit::window_from_str(name, window);
}
int dspf_window_from_str(const char* name, int* window) {
    return wavkit::window_from_str(name, window);
}
