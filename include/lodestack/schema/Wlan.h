// The WLAN records and measurement: one access point heard in a scan.
//
//   WlanDn (128)            bssid (1): 6 bytes (a MAC address) or 8 bytes,
//                           most significant first; 8-bit mask
//   WlanApMeasurement (129) ssid u16 (1), rxLevel i8 (2), txLevel i8 (4),
//                           rssi u8 (256), distance u8 (8),
//                           distanceUncertainty u8 (16), band u8 (32),
//                           apLatitude i32 (64), apLongitude i32 (128);
//                           16-bit mask, fields travel in this order
//   WlanMeasurement (type 20)  dn (flag 1, id 200), timeStamp (2, 205),
//                           wlanApMeasurement (4, id 129)
//
// The records follow Record.h (setters store without range checks, except
// WlanDn's byte-array setter, which takes lengths 6 and 8 only). Values are
// stored in the units the platform's measurement library delivers. The
// measurement follows MeasurementBase.h: its getters throw NotFound (4) when
// the property is absent. One thread at a time.
#ifndef LODESTACK_SCHEMA_WLAN_H
#define LODESTACK_SCHEMA_WLAN_H

#include <string>

#include "lodestack/schema/MeasurementBase.h"
#include "lodestack/schema/Record.h"

namespace lodestack {
namespace schema {

// The stored BSSID: `length` leading bytes of `bytes` are in use.
struct Bssid {
  static constexpr unsigned int kCapacity = 8;
  unsigned char length = 0;
  unsigned char bytes[kCapacity] = {};
};

// Bytes of a BSSID: a length byte, then that many bytes. A length above 8
// does not fit and fails the read.
template <>
struct FieldCodec<Bssid> {
  static bool isSet(const Bssid&) { return true; }
  static bool write(IStream& s, const Bssid& v) {
    return v.length <= Bssid::kCapacity && s.writeUint8(v.length) &&
           s.write(v.bytes, v.length) == v.length;
  }
  static bool read(IStream& s, Bssid& v) {
    unsigned char length = 0;
    if (!s.readUint8(length) || length > Bssid::kCapacity) return false;
    if (s.read(v.bytes, length) != length) return false;
    v.length = length;
    return true;
  }
  static bool equal(const Bssid& a, const Bssid& b) {
    return a.length == b.length && std::memcmp(a.bytes, b.bytes, a.length) == 0;
  }
  static bool copy(Bssid& to, const Bssid& from) {
    to = from;
    return true;
  }
};

class LODESTACK_EXPORT WlanDn
    : public Record<WlanDn, 128, FieldTable<unsigned char, Field<Bssid, 1>>> {
 public:
  static constexpr unsigned char kBssid = 1;

  WlanDn() = default;
  // As setBssid(bssid).
  explicit WlanDn(unsigned long long bssid) { setBssid(bssid); }
  using Record::create;
  static gom::SharedPointer<WlanDn> create(unsigned long long bssid);

  // Stores the 8 bytes of `value`, most significant first; returns Ok.
  Status setBssid(unsigned long long value);
  // Copies `length` bytes; InvalidArgument, with nothing changed, for a
  // length other than 6 or 8.
  [[nodiscard]] Status setBssid(const unsigned char* bytes, unsigned int length);
  // The identifier as a number: 8 bytes as they are; 6 bytes b1..b6 widened
  // to b1 b2 b3 FF FF b4 b5 b6. 0 when absent or of another length.
  unsigned long long bssid() const;
  // The stored bytes and their count; null and 0 when absent.
  const unsigned char* getBssid(unsigned int& length) const;

  // The bytes as upper-case hex pairs joined by ':' ("11:22:33:44:55:66");
  // empty when absent.
  std::string text() const;
  // Composes the text for diagnostics and writes it nowhere.
  void dump() const override;
};

class LODESTACK_EXPORT WlanApMeasurement
    : public Record<WlanApMeasurement, 129,
                    FieldTable<unsigned short, Field<unsigned short, 1>, Field<signed char, 2>,
                               Field<signed char, 4>, Field<unsigned char, 256>,
                               Field<unsigned char, 8>, Field<unsigned char, 16>,
                               Field<unsigned char, 32>, Field<int, 64>, Field<int, 128>>> {
 public:
  enum Bit : unsigned short {
    Ssid = 1,
    RxLevel = 2,
    TxLevel = 4,
    Distance = 8,
    DistanceUncertainty = 16,
    Band = 32,
    ApLatitude = 64,
    ApLongitude = 128,
    Rssi = 256  // out of step with its place among the fields; part of the format
  };

  LODESTACK_RECORD_PROPERTY(0, ssid, setSsid)
  LODESTACK_RECORD_PROPERTY(1, rxLevel, setRxLevel)
  LODESTACK_RECORD_PROPERTY(2, txLevel, setTxLevel)
  LODESTACK_RECORD_PROPERTY(3, rssi, setRssi)
  LODESTACK_RECORD_PROPERTY(4, distance, setDistance)
  LODESTACK_RECORD_PROPERTY(5, distanceUncertainty, setDistanceUncertainty)
  LODESTACK_RECORD_PROPERTY(6, band, setBand)
  LODESTACK_RECORD_PROPERTY(7, apLatitude, setApLatitude)
  LODESTACK_RECORD_PROPERTY(8, apLongitude, setApLongitude)
};

class LODESTACK_EXPORT WlanMeasurement : public Measurement<WlanDn, 20> {
 public:
  static constexpr unsigned int kWlanApMeasurement = 0x4;
  static constexpr unsigned int kAllFlags = kWlanApMeasurement | Measurement::kAllFlags;
  static constexpr unsigned short kWlanApMeasurementId = 129;

  // An empty measurement; null when memory is exhausted.
  static gom::SharedPointer<WlanMeasurement> create();
  // With the identity (200) and time stamp (205) set.
  static gom::SharedPointer<WlanMeasurement> create(const gom::SharedPointer<WlanDn>& dn,
                                                    unsigned int timeStamp);
  // Wraps `object` (shared); null unless its key is 20.
  static gom::SharedPointer<WlanMeasurement> create(
      const gom::SharedPointer<gom::GenericObject>& object);

  WlanMeasurement(const WlanMeasurement&) = default;
  WlanMeasurement& operator=(const WlanMeasurement&) = default;
  ~WlanMeasurement() override;

  bool valueExists(unsigned int mask) const override;
  void unset(unsigned int mask) override;

  // Throws NotFound when absent; empty when the stored record is of
  // another class.
  gom::SharedPointer<WlanApMeasurement> wlanApMeasurement() const;
  void setWlanApMeasurement(const gom::SharedPointer<WlanApMeasurement>& measurement);

 private:
  WlanMeasurement() = default;
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_WLAN_H
