// Storage of the byte buffer: sizes, copies and element access. A zero byte is always kept right
// after the last byte, so that ptr() is a text wherever the buffer holds one.
#include "ZinRT/Zin_ByteBuffer.h"

#include <algorithm>
#include <cstring>
#include <stdexcept>
#include <string>
#include <utility>

namespace ZinRT {

namespace {
// What a moved-from buffer (which holds no storage) yields from its const accessors.
const unsigned char kEmptyText = 0;
}  // namespace

Zin_ByteBuffer::Zin_ByteBuffer() : bytes_(1, 0) {}

Zin_ByteBuffer::Zin_ByteBuffer(uint32_t size, uint32_t reserve, uint32_t growBy)
    : size_(size), growBy_(growBy) {
  bytes_.reserve(static_cast<size_t>(size) + reserve + 1);
  bytes_.resize(static_cast<size_t>(size) + 1, 0);
}

Zin_ByteBuffer::Zin_ByteBuffer(const unsigned char* data, uint32_t size)
    : bytes_(static_cast<size_t>(size) + 1, 0), size_(size) {
  if (data != nullptr && size != 0) std::memcpy(bytes_.data(), data, size);
}

Zin_ByteBuffer::Zin_ByteBuffer(const Zin_ByteBuffer& other)
    : bytes_(other.uPtr(), other.uPtr() + other.size_ + 1),
      size_(other.size_),
      growBy_(other.growBy_) {}

Zin_ByteBuffer::Zin_ByteBuffer(Zin_ByteBuffer&& other) noexcept
    : bytes_(std::move(other.bytes_)), size_(other.size_), growBy_(other.growBy_) {
  other.bytes_.clear();
  other.size_ = 0;
}

Zin_ByteBuffer& Zin_ByteBuffer::operator=(const Zin_ByteBuffer& other) {
  if (this != &other) {
    bytes_.assign(other.uPtr(), other.uPtr() + other.size_ + 1);
    size_ = other.size_;
    growBy_ = other.growBy_;
  }
  return *this;
}

Zin_ByteBuffer& Zin_ByteBuffer::operator=(Zin_ByteBuffer&& other) noexcept {
  if (this != &other) {
    bytes_ = std::move(other.bytes_);
    size_ = other.size_;
    growBy_ = other.growBy_;
    other.bytes_.clear();
    other.size_ = 0;
  }
  return *this;
}

Zin_ByteBuffer::~Zin_ByteBuffer() = default;

uint32_t Zin_ByteBuffer::getSize() const {
  return size_;
}

void Zin_ByteBuffer::ensureCapacity(uint32_t size) {
  const size_t needed = static_cast<size_t>(size) + 1;
  if (bytes_.capacity() >= needed) return;
  // Grow by at least growBy_ and at least geometrically, so that appending stays linear.
  const size_t grown = bytes_.capacity() + std::max<size_t>(growBy_, bytes_.capacity() / 2);
  bytes_.reserve(std::max(needed, grown));
}

void Zin_ByteBuffer::resize(uint32_t size) {
  ensureCapacity(size);
  if (bytes_.empty()) bytes_.push_back(0);
  if (size < size_) std::fill(bytes_.begin() + size, bytes_.begin() + size_, 0);
  bytes_.resize(static_cast<size_t>(size) + 1, 0);
  size_ = size;
}

void Zin_ByteBuffer::append(const unsigned char* data, uint32_t size) {
  if (size == 0) return;
  if (size > UINT32_MAX - size_ - 1) throw std::length_error("Zin_ByteBuffer: size too large");
  const uint32_t old = size_;
  // Appending a part of this buffer to itself: the bytes may move when the storage grows.
  const unsigned char* base = bytes_.data();
  const bool inside = data != nullptr && !bytes_.empty() && data >= base && data < base + size_;
  const size_t offset = inside ? static_cast<size_t>(data - base) : 0;
  resize(old + size);
  if (inside) data = bytes_.data() + offset;
  if (data != nullptr) std::memmove(bytes_.data() + old, data, size);
}

unsigned char* Zin_ByteBuffer::uPtr() {
  if (bytes_.empty()) bytes_.push_back(0);
  return bytes_.data();
}

const unsigned char* Zin_ByteBuffer::uPtr() const {
  return bytes_.empty() ? &kEmptyText : bytes_.data();
}

char* Zin_ByteBuffer::ptr() {
  return reinterpret_cast<char*>(uPtr());
}

const char* Zin_ByteBuffer::ptr() const {
  return reinterpret_cast<const char*>(uPtr());
}

unsigned char& Zin_ByteBuffer::operator[](uint32_t index) {
  if (index >= size_) {
    throw std::out_of_range("Zin_ByteBuffer: index " + std::to_string(index) +
                            " past the end (size " + std::to_string(size_) + ")");
  }
  return bytes_[index];
}

unsigned char Zin_ByteBuffer::operator[](uint32_t index) const {
  if (index >= size_) {
    throw std::out_of_range("Zin_ByteBuffer: index " + std::to_string(index) +
                            " past the end (size " + std::to_string(size_) + ")");
  }
  return bytes_[index];
}

}  // namespace ZinRT
