#pragma once

#include <cstdint>
#include <utility>

#include "propertylist/value/PropertyArray.h"
#include "propertylist/value/PropertyDictionary.h"
#include "propertylist/value/PropertyScalars.h"
#include "propertylist/value/Text.h"

namespace accounts {

/// What a value holds: a variant that knows that every kind is either a plain number or one handle
/// to a shared node, so that moving takes no look at the kind and copying only one. Reading a file
/// takes a seventh more instructions with std::variant in its place.
class PropertyContent {
 public:
  /// Those that hold a node come first.
  enum class Form : std::uint8_t {
    Dictionary,
    Array,
    Text,
    Data,
    Signed,
    LargeUnsigned,
    Real,
    Boolean,
    Date
  };

  explicit PropertyContent(PropertyDictionary content)
      : form_(Form::Dictionary), dictionary(std::move(content)) {}
  explicit PropertyContent(PropertyArray content) : form_(Form::Array), array(std::move(content)) {}
  explicit PropertyContent(Text content) : form_(Form::Text), text(std::move(content)) {}
  explicit PropertyContent(PropertyData content) : form_(Form::Data), data(std::move(content)) {}
  explicit PropertyContent(std::int64_t content) : form_(Form::Signed), signedInteger(content) {}
  explicit PropertyContent(std::uint64_t content)
      : form_(Form::LargeUnsigned), unsignedInteger(content) {}
  explicit PropertyContent(double content) : form_(Form::Real), real(content) {}
  explicit PropertyContent(bool content) : form_(Form::Boolean), bits_(0) { boolean = content; }
  explicit PropertyContent(PropertyDate content) : form_(Form::Date), date(content) {}

  PropertyContent(const PropertyContent& other) : form_(other.form_), bits_(other.bits_) {
    if (holdsNode()) {
      node_->retain();
    }
  }
  PropertyContent(PropertyContent&& other) noexcept
      : form_(std::exchange(other.form_, Form::Signed)), bits_(other.bits_) {}
  PropertyContent& operator=(PropertyContent other) noexcept {
    std::swap(form_, other.form_);
    std::swap(bits_, other.bits_);
    return *this;
  }
  ~PropertyContent() {
    if (holdsNode() && node_->releaseIsLast()) {
      destroyNode();
    }
  }

  [[nodiscard]] Form form() const { return form_; }

 private:
  [[nodiscard]] bool holdsNode() const { return form_ <= Form::Data && node_ != nullptr; }
  void destroyNode();

  Form form_;

 public:
  /// Which of them there is, the form says.
  union {
    PropertyDictionary dictionary;
    PropertyArray array;
    Text text;
    PropertyData data;
    std::int64_t signedInteger;
    std::uint64_t unsignedInteger;
    double real;
    bool boolean;
    PropertyDate date;
    /// Whatever there is as plain bits, or as the node of one of the first four.
    std::uint64_t bits_;
    SharedNodeBase* node_;
  };
};

}  // namespace accounts
