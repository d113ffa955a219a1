#pragma once

#include <array>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>

namespace accounts {

/// Puts numbers and texts one behind the other, for another process of the same program.
class FlatWriter {
 public:
  template <class Number>
  void add(Number number) {
    static_assert(std::is_integral_v<Number>);
    std::array<char, sizeof number> bytes{};
    std::memcpy(bytes.data(), &number, sizeof number);
    bytes_.append(bytes.data(), bytes.size());
  }
  void addText(std::string_view text) {
    add(static_cast<std::uint32_t>(text.size()));
    bytes_.append(text);
  }
  [[nodiscard]] std::string take() { return std::move(bytes_); }

 private:
  std::string bytes_;
};

/// Takes them again. After the first that is not there, or is not what it has to be, there is
/// nothing more and `isGood` says so.
class FlatReader {
 public:
  explicit FlatReader(std::string_view bytes) : rest_(bytes) {}

  template <class Number>
  Number take() {
    Number number = 0;
    isGood_ = isGood_ && rest_.size() >= sizeof number;
    if (isGood_) {
      std::memcpy(&number, rest_.data(), sizeof number);
      rest_.remove_prefix(sizeof number);
    }
    return number;
  }
  bool takeBoolean() {
    const auto number = take<std::uint8_t>();
    isGood_ = isGood_ && number <= 1;
    return number == 1;
  }
  std::string takeText(std::size_t longest) {
    const auto size = take<std::uint32_t>();
    isGood_ = isGood_ && size <= longest && size <= rest_.size();
    if (!isGood_) {
      return "";
    }
    std::string text(rest_.substr(0, size));
    rest_.remove_prefix(size);
    return text;
  }
  void refuse() { isGood_ = false; }
  [[nodiscard]] bool isGood() const { return isGood_; }
  [[nodiscard]] bool isAtEnd() const { return rest_.empty(); }

 private:
  std::string_view rest_;
  bool isGood_ = true;
};

}  // namespace accounts
