// Firmware images: taken in, verified, written to the flash.
#include "lrmapi/Call.h"
#include "state/Firmware_Image.h"

using namespace tvx::sim;

namespace {

// This library's own statuses for images.
constexpr RM_STATUS image_unreadable = 26;
constexpr RM_STATUS image_malformed = 145;
constexpr RM_STATUS image_for_another_model = 144;

RM_STATUS check(const char* path, Firmware_Image& image) {
  if (path == nullptr) return RM_ERROR;
  switch (check_image(path, image)) {
    case Image_Check::Good:
      return RM_OK;
    case Image_Check::Unreadable:
      return image_unreadable;
    default:
      return image_malformed;
  }
}

RM_STATUS check_for(const char* path, const Card& card, Firmware_Image& image) {
  const RM_STATUS status = check(path, image);
  if (status != RM_OK) return status;
  return card.model.starts_with(image.model) ? RM_OK : image_for_another_model;
}

// The image goes to the flash of the card: all its ports tell it, and none runs it yet.
void write_flash(World& world, const Port& port, const std::string& version) {
  for (Port& other : world.ports) {
    if (other.card != port.card) continue;
    other.card_values.insert_or_assign(RM_HA_FIRMWARE_ON_FLASH, text_value(version));
    other.firmware.pending = version;
    activate(other, Activation::At_Once);
  }
}

}  // namespace

extern "C" {

RM_STATUS RM_ImportHBAFileA(const char* path) {
  return rm_call(Call_Site{.name = "RM_ImportHBAFileA"}, [path](World&, const Fault_Effect&) {
    Firmware_Image image;
    return check(path, image);
  });
}

RM_STATUS RM_VerifyFirmwareA(int, HBA_WWN wwpn, const char* path) {
  return port_call("RM_VerifyFirmwareA", wwpn,
                   [path](const World& world, const Port& port, const Fault_Effect&) {
                     Firmware_Image image;
                     return check_for(path, world.cards[port.card], image);
                   });
}

RM_STATUS LRM_DownloadFirmware(HBA_WWN wwpn, const char* path, int) {
  return port_call("LRM_DownloadFirmware", wwpn,
                   [path](World& world, Port& port, const Fault_Effect&) -> RM_STATUS {
                     Firmware_Image image;
                     const RM_STATUS status = check_for(path, world.cards[port.card], image);
                     if (status != RM_OK) return status;
                     write_flash(world, port, image.version);
                     return port.firmware.activation == Activation::Reboot ? RM_NEED_REBOOT : RM_OK;
                   });
}

}  // extern "C"
