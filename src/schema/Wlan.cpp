#include "lodestack/schema/Wlan.h"

#include <cstdio>

namespace lodestack {
namespace schema {

gom::SharedPointer<WlanDn> WlanDn::create(unsigned long long bssid) {
  gom::SharedPointer<WlanDn> dn = create();
  if (dn) dn->setBssid(bssid);
  return dn;
}

Status WlanDn::setBssid(unsigned long long value) {
  Bssid b;
  b.length = 8;
  for (int i = 7; i >= 0; --i, value >>= 8) b.bytes[i] = static_cast<unsigned char>(value);
  return setField<0>(b);
}

Status WlanDn::setBssid(const unsigned char* bytes, unsigned int length) {
  if (length != 6 && length != 8) return InvalidArgument;
  Bssid b;
  b.length = static_cast<unsigned char>(length);
  std::memcpy(b.bytes, bytes, length);
  return setField<0>(b);
}

unsigned long long WlanDn::bssid() const {
  if (!valueExists(kBssid)) return 0;
  const Bssid& b = field<0>();
  unsigned char wide[8];
  if (b.length == 8) {
    std::memcpy(wide, b.bytes, 8);
  } else if (b.length == 6) {
    // FF FF, not FF FE, after the third byte: stored identifiers are
    // compared in this form, so it is kept deliberately.
    const unsigned char widened[8] = {b.bytes[0], b.bytes[1], b.bytes[2], 0xFF,
                                      0xFF,       b.bytes[3], b.bytes[4], b.bytes[5]};
    std::memcpy(wide, widened, 8);
  } else {
    return 0;
  }
  unsigned long long value = 0;
  for (unsigned char byte : wide) value = value << 8 | byte;
  return value;
}

const unsigned char* WlanDn::getBssid(unsigned int& length) const {
  if (!valueExists(kBssid)) {
    length = 0;
    return nullptr;
  }
  length = field<0>().length;
  return field<0>().bytes;
}

std::string WlanDn::text() const {
  char buffer[25] = "";  // 8 bytes as "XX:" pairs, less the last ':'
  unsigned int length = 0;
  const unsigned char* bytes = getBssid(length);
  for (unsigned int i = 0, at = 0; i < length; ++i, at += 3)
    std::snprintf(buffer + at, sizeof buffer - at, "%02X%s", bytes[i], i + 1 < length ? ":" : "");
  return buffer;
}

void WlanDn::dump() const { (void)text(); }

namespace {
const FlagProperty kWlanFlags[] = {
    {WlanMeasurement::kWlanApMeasurement, WlanMeasurement::kWlanApMeasurementId}};
}  // namespace

WlanMeasurement::~WlanMeasurement() = default;

gom::SharedPointer<WlanMeasurement> WlanMeasurement::create() {
  gom::SharedPointer<WlanMeasurement> m(new (std::nothrow) WlanMeasurement());
  return m && m->baseCreate(kTypeId) ? m : gom::SharedPointer<WlanMeasurement>();
}

gom::SharedPointer<WlanMeasurement> WlanMeasurement::create(const gom::SharedPointer<WlanDn>& dn,
                                                            unsigned int timeStamp) {
  gom::SharedPointer<WlanMeasurement> m(new (std::nothrow) WlanMeasurement());
  return m && m->baseCreate(kTypeId, dn, timeStamp) ? m : gom::SharedPointer<WlanMeasurement>();
}

gom::SharedPointer<WlanMeasurement> WlanMeasurement::create(
    const gom::SharedPointer<gom::GenericObject>& object) {
  gom::SharedPointer<WlanMeasurement> m(new (std::nothrow) WlanMeasurement());
  return m && m->baseCreate(kTypeId, object) ? m : gom::SharedPointer<WlanMeasurement>();
}

bool WlanMeasurement::valueExists(unsigned int mask) const {
  return !(mask & ~kAllFlags) && flagsPresent(mask, kWlanFlags) &&
         Measurement::valueExists(mask & Measurement::kAllFlags);
}

void WlanMeasurement::unset(unsigned int mask) {
  removeFlags(mask, kWlanFlags);
  Measurement::unset(mask & Measurement::kAllFlags);
}

gom::SharedPointer<WlanApMeasurement> WlanMeasurement::wlanApMeasurement() const {
  gom::SharedPointer<gom::ObjectBase> record;
  getProperty(kWlanApMeasurementId, record, "wlanApMeasurement");
  return gom::SharedPointer<WlanApMeasurement>::cast(record);
}

void WlanMeasurement::setWlanApMeasurement(
    const gom::SharedPointer<WlanApMeasurement>& measurement) {
  setProperty(kWlanApMeasurementId, gom::SharedPointer<gom::ObjectBase>(measurement),
              "wlanApMeasurement");
}

}  // namespace schema
}  // namespace lodestack
