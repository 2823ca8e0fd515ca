// Medians of sliding windows: of short ones by networks, of longer ones in windows that stay
// sorted, of long ones by way of sorted blocks.
#include <algorithm>
#include <cstdint>

#include "smooth/network.hpp"
#include "smooth/sorted_window.hpp"

namespace wavkit {
namespace {

/// From how many samples on sorting blocks is faster than moving what is between two places.
constexpr std::size_t long_window = 256;

/// A block of samples in order, as a list that some of them are taken out of and come back to, and
/// a place in it (J. Suomela, 2014). Links are between places in that order: the samples begin
/// at 1.
template <class T>
class SortedBlock {
  public:
    using Key = kernel::OrderKey<T>;
    struct Item {
        Key key;
        std::uint32_t index;
    };
    struct Links {
        std::uint32_t previous, next;
    };

    /// `items` are for n samples, `links` and `places` for n + 2.
    SortedBlock(Item* items, Links* links, std::uint32_t* places, std::size_t n)
        : items_(items), links_(links), places_(places), n_(std::uint32_t(n)) {}

    /// Takes n samples, key(i) each, all of them in the list or, `empty`, none.
    template <class KeyOf>
    void fill(KeyOf key, bool empty) {
        for (std::uint32_t i = 0; i < n_; ++i) items_[i] = {key(i), i};
        std::sort(items_, items_ + n_, [](const Item& a, const Item& b) { return a.key < b.key; });
        for (std::uint32_t i = 0; i < n_; ++i) places_[items_[i].index] = i + 1;
        for (std::uint32_t i = 0; i < n_ + 2; ++i) links_[i] = {i - 1, i + 1};
        below_ = 0;
        at_ = 1;
        if (!empty) return;
        for (std::uint32_t i = n_; i-- > 0;) unlink(places_[i]);
        at_ = n_ + 1;
    }

    /// Takes a sample out; those that came in later went out before it.
    void remove(std::uint32_t i) {
        const std::uint32_t place = places_[i];
        unlink(place);
        if (place < at_) --below_;
        if (place == at_) at_ = links_[place].next;
    }
    /// Brings it back; those that went out later came back before it.
    void restore(std::uint32_t i) {
        const std::uint32_t place = places_[i];
        const auto [previous, next] = links_[place];
        links_[previous].next = links_[next].previous = place;
        if (place < at_) ++below_;
    }

    /// How many samples are below the place, and the samples at it, before it and behind it.
    std::size_t below() const { return below_; }
    bool at_end() const { return at_ > n_; }
    Key here() const { return items_[at_ - 1].key; }
    Key before() const { return items_[links_[at_].previous - 1].key; }
    bool none_behind() const { return links_[at_].next > n_; }
    Key behind() const { return items_[links_[at_].next - 1].key; }
    void advance() { at_ = links_[at_].next, ++below_; }
    void retreat() { at_ = links_[at_].previous, --below_; }

  private:
    void unlink(std::uint32_t place) {
        const auto [previous, next] = links_[place];
        links_[previous].next = next;
        links_[next].previous = previous;
    }

    Item* items_;
    Links* links_;
    std::uint32_t* places_;
    std::uint32_t n_, at_ = 0, below_ = 0;
};

/// Two blocks as one list: what is before the place in either is before what is behind it in both.
template <class T>
class TwoBlocks {
    using Key = kernel::OrderKey<T>;

  public:
    TwoBlocks(SortedBlock<T>& a, SortedBlock<T>& b) : a_(a), b_(b) {}

    /// Goes to where so many samples are below.
    void go_to(std::size_t rank) {
        while (a_.below() + b_.below() < rank) first_behind().advance();
        while (a_.below() + b_.below() > rank) last_before().retreat();
        // The sample that came in last may be on the wrong side of the other block's place.
        while (lies_above(a_, b_) || lies_above(b_, a_)) {
            last_before().retreat();
            first_behind().advance();
        }
    }
    Key here() { return first_behind().here(); }
    Key following() {
        auto& block = first_behind();
        const auto& other = &block == &a_ ? b_ : a_;
        if (block.none_behind()) return other.here();
        if (other.at_end() || block.behind() < other.here()) return block.behind();
        return other.here();
    }

  private:
    /// Whether the one's samples before the place do so of the other's behind it.
    static bool lies_above(const SortedBlock<T>& one, const SortedBlock<T>& other) {
        return one.below() > 0 && !other.at_end() && other.here() < one.before();
    }
    SortedBlock<T>& first_behind() {
        if (a_.at_end() || b_.at_end()) return a_.at_end() ? b_ : a_;
        return b_.here() < a_.here() ? b_ : a_;
    }
    SortedBlock<T>& last_before() {
        if (a_.below() == 0 || b_.below() == 0) return a_.below() == 0 ? b_ : a_;
        return a_.before() < b_.before() ? b_ : a_;
    }

    SortedBlock<T>&a_, &b_;
};

/// Blocks of a window each, and the window that slides from one onto the next. Samples that are
/// absent count as below all others.
template <class T>
int slide_over_blocks(const Segment<T>& s, T* out) {
    using Block = SortedBlock<T>;
    using Key = kernel::OrderKey<T>;
    const std::size_t w = s.window, blocks = (s.samples() + w - 1) / w;
    const std::unique_ptr<typename Block::Item[]> items(new (std::nothrow)
                                                            typename Block::Item[2 * w]);
    const std::unique_ptr<typename Block::Links[]> links(new (std::nothrow)
                                                             typename Block::Links[2 * (w + 2)]);
    const std::unique_ptr<std::uint32_t[]> places(new (std::nothrow) std::uint32_t[2 * w]);
    if (!items || !links || !places) return -1;
    const auto keys = [&](std::size_t block) {
        return [=, first = block * w, end = s.samples() - s.absent_behind](std::size_t i) {
            const std::size_t at = first + i;
            return at < s.absent_before || at >= end ? std::numeric_limits<Key>::min()
                                                     : key_of(s.x[at]);
        };
    };
    Block two[2] = {{items.get(), links.get(), places.get(), w},
                    {items.get() + w, links.get() + w + 2, places.get() + w, w}};
    two[0].fill(keys(0), false);
    for (std::size_t b = 0, i = 0; b < blocks; ++b) {
        auto &old = two[b % 2], &fresh = two[(b + 1) % 2];
        fresh.fill(keys(b + 1), true);
        TwoBlocks<T> both(old, fresh);
        for (std::uint32_t r = 0; r < w; ++r) {
            const std::size_t present = s.present(i);
            both.go_to(w - present + (present - 1) / 2);
            const Key lower = both.here(), upper = present % 2 ? lower : both.following();
            out[i] = middle_of(value_of<T>(lower), value_of<T>(upper), present);
            if (++i == s.count) return 0;
            old.remove(r);
            fresh.restore(r);
        }
    }
    return 0;
}

template <class T>
bool by_network(const Segment<T>& s, T* out) {
    return in_network(s, [&]<int Window>(std::integral_constant<int, Window>) {
        slide<Window>(s.x, s.count, out,
                      [](const auto& values) { return median_of<Window>(values) + T(0); });
    });
}

template <class T>
int write_medians(const Segment<T>& s, T* out) {
    if (by_network(s, out)) return 0;
    if (s.window >= long_window) return slide_over_blocks(s, out);
    return slide_sorted(s, [=](std::size_t i, const auto& sorted) { out[i] = sorted.median(); });
}

template <Record R>
int moving_median(const R* in, R* out, int window, int ends, R* state, bool last) {
    using T = scalar<R>;
    if (in->complex || window < 1 || ends < DSP_ENDS_SHORTER || ends > DSP_ENDS_ZERO) return -1;
    return run_windows(
        in, out, std::size_t(window), state, last, [=](const WindowCall<R>& call, R* result) {
            return in_segments(call, ends, result->data, [](const Segment<T>& segment, T* to) {
                return write_medians(segment, to);
            });
        });
}

}  // namespace
}  // namespace wavkit

int dspd_median(const dsp* in, dsp* out, int window, int ends, dsp* state, int last) {
    return wavkit::moving_median(in, out, window, ends, state, last != 0);
}
int dspfd_median(const dspf* in, dspf* out, int window, int ends, dspf* state, int last) {
    return wavkit::moving_median(in, out, window, ends, state, last != 0);
}
