#include "lrmapi/Call.h"

namespace tvx::sim {
namespace {

// Texts lose their end: the closing zero becomes part of the text.
void spoil_ends(Attribute_Map& values) {
  for (auto& [id, value] : values) {
    if (value.size() > 1 && value.back() == 0) value.back() = 'x';
  }
}

}  // namespace

RM_STATUS answer_block(Attribute_Map values, void* block, std::uint32_t* size,
                       const Fault_Effect& effect) {
  if (block == nullptr || size == nullptr) return RM_ERROR;
  for (const std::uint32_t id : effect.omitted) values.erase(id);
  if (effect.unterminated) spoil_ends(values);
  const std::size_t room = *size;
  if (effect.garbage) {
    write_garbage(block, room);
    return RM_OK;
  }
  const std::size_t needed = write_block(values, block, room);
  *size = effect.returned_size.value_or(static_cast<std::uint32_t>(needed));
  if (needed > room) return RM_ERROR_MORE_DATA;
  if (effect.truncated && *effect.truncated < needed) {
    std::memset(static_cast<std::uint8_t*>(block) + *effect.truncated, 0,
                needed - *effect.truncated);
  }
  return RM_OK;
}

RM_STATUS answer_text(const std::string& text, char* buffer, std::size_t room,
                      const Fault_Effect& effect) {
  if (buffer == nullptr) return RM_ERROR;
  if (text.size() + 1 > room) return RM_ERROR_VERSION_TOO_SMALL;
  write_text(buffer, room, text, effect);
  return RM_OK;
}

}  // namespace tvx::sim
