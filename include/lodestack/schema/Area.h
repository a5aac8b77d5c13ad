// Area (type id 104): a value record holding one Coverage value, the
// coverage area of a cell. Its accessors are those of Coverage, with the same
// presence bits and rules; its bytes are version 1, then the Coverage's mask
// and present fields. Equality compares the Coverage values, then the
// ObjectBase part. One thread at a time.
#ifndef LODESTACK_SCHEMA_AREA_H
#define LODESTACK_SCHEMA_AREA_H

#include "lodestack/schema/Coverage.h"

namespace lodestack {
namespace schema {

class LODESTACK_EXPORT Area : public Record<Area, 104, Coverage> {
 public:
  Area() = default;
  // Copies the whole value, mask included.
  explicit Area(const Coverage& coverage) { static_cast<Coverage&>(*this) = coverage; }
  // An ellipse: coded latitude and longitude, semi-axes in metres,
  // orientation in degrees; marks those five present.
  Area(int latitude, int longitude, unsigned int majorAxis, unsigned int minorAxis, float angle)
      : Area(Coverage(latitude, longitude, majorAxis, minorAxis, angle)) {}

  using Record::create;
  static gom::SharedPointer<Area> create(const Coverage& coverage) {
    gom::SharedPointer<Area> area = create();
    if (area) static_cast<Coverage&>(*area) = coverage;
    return area;
  }
  static gom::SharedPointer<Area> create(int latitude, int longitude, unsigned int majorAxis,
                                         unsigned int minorAxis, float angle) {
    return create(Coverage(latitude, longitude, majorAxis, minorAxis, angle));
  }

  const Coverage& coverage() const { return *this; }
};

}  // namespace schema
}  // namespace lodestack

#endif  // LODESTACK_SCHEMA_AREA_H
