// Pairs the entries of an old and a new list that stand for the same thing,
// in rounds of keys from the most to the least certain. Each round is one
// hash-map pass, so lists of a hundred thousand applications pair in time
// and memory proportional to their length.
#ifndef CVN_TOOLS_RECORD_MATCH_H_
#define CVN_TOOLS_RECORD_MATCH_H_

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace cvn {

struct MatchKey {
  std::string_view first;
  std::string_view second;
  bool operator==(const MatchKey& other) const {
    return first == other.first && second == other.second;
  }
};

struct MatchKeyHash {
  size_t operator()(const MatchKey& key) const {
    size_t h = std::hash<std::string_view>()(key.first);
    return h ^ (std::hash<std::string_view>()(key.second) + 0x9e3779b97f4a7c15ULL + (h << 6) +
                (h >> 2));
  }
};

class ListPairing {
 public:
  static constexpr uint32_t kNone = UINT32_MAX;

  ListPairing(size_t old_count, size_t new_count)
      : new_of_old_(old_count, kNone), old_of_new_(new_count, kNone) {}

  /// Pairs the entries left unpaired whose keys are equal, in list order:
  /// the k-th old entry with a key goes with the k-th new one, so equal
  /// keys (two identical USB hubs) pair up in the order they were found.
  /// `old_key(i, &key)` and `new_key(j, &key)` return false for an entry
  /// that has no key in this round.
  template <typename OldKey, typename NewKey>
  void pairBy(OldKey old_key, NewKey new_key) {
    const size_t old_count = new_of_old_.size();
    if (old_count * old_of_new_.size() <= kSmallList) {
      pairSmall(old_key, new_key);
      return;
    }
    std::unordered_map<MatchKey, uint32_t, MatchKeyHash> first_with_key;
    std::vector<uint32_t> next_with_key(old_count, kNone);
    MatchKey key;
    // Backwards, so that each chain of equal keys runs in list order.
    for (size_t i = old_count; i-- > 0;) {
      if (new_of_old_[i] != kNone || !old_key(i, &key)) continue;
      auto found = first_with_key.try_emplace(key, static_cast<uint32_t>(i));
      if (!found.second) {
        next_with_key[i] = found.first->second;
        found.first->second = static_cast<uint32_t>(i);
      }
    }
    for (size_t j = 0; j < old_of_new_.size() && !first_with_key.empty(); ++j) {
      if (old_of_new_[j] != kNone || !new_key(j, &key)) continue;
      auto found = first_with_key.find(key);
      if (found == first_with_key.end()) continue;
      uint32_t i = found->second;
      old_of_new_[j] = i;
      new_of_old_[i] = static_cast<uint32_t>(j);
      if (next_with_key[i] == kNone) {
        first_with_key.erase(found);
      } else {
        found->second = next_with_key[i];
      }
    }
  }

  /// The old entry paired with new entry `j`, or kNone.
  uint32_t oldOf(size_t j) const { return old_of_new_[j]; }
  /// The new entry paired with old entry `i`, or kNone.
  uint32_t newOf(size_t i) const { return new_of_old_[i]; }

 private:
  // A record's handful of fields pair faster by looking than by hashing.
  static constexpr size_t kSmallList = 256;

  template <typename OldKey, typename NewKey>
  void pairSmall(OldKey old_key, NewKey new_key) {
    MatchKey key, other;
    for (size_t j = 0; j < old_of_new_.size(); ++j) {
      if (old_of_new_[j] != kNone || !new_key(j, &key)) continue;
      for (size_t i = 0; i < new_of_old_.size(); ++i) {
        if (new_of_old_[i] == kNone && old_key(i, &other) && other == key) {
          old_of_new_[j] = static_cast<uint32_t>(i);
          new_of_old_[i] = static_cast<uint32_t>(j);
          break;
        }
      }
    }
  }

  std::vector<uint32_t> new_of_old_;
  std::vector<uint32_t> old_of_new_;
};

}  // namespace cvn

#endif  // CVN_TOOLS_RECORD_MATCH_H_
