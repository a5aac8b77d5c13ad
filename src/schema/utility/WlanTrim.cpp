// Ranking and trimming of WLAN measurement collections.
#include <algorithm>
#include <new>
#include <utility>
#include <vector>

#include "lodestack/schema/Wlan.h"
#include "lodestack/schema/utility/Utility.h"

namespace lodestack {
namespace schema {

namespace {

// 0 for an entry without a received level, else 129 + rxLevel (1 to 256),
// so that ranks compare as sortWlans orders.
int rankOf(const gom::Variant* entry) {
  gom::SharedPointer<gom::GenericObject> object;
  if (!entry || entry->getGenericObjectValue(object) != Ok || !object ||
      object->key() != WlanMeasurement::kTypeId)
    return 0;
  gom::SharedPointer<gom::ObjectBase> record;
  if (object->getObjectProperty(WlanMeasurement::kWlanApMeasurementId, record) != Ok) return 0;
  const gom::SharedPointer<WlanApMeasurement> ap =
      gom::SharedPointer<WlanApMeasurement>::cast(record);
  if (!ap || !ap->valueExists(WlanApMeasurement::RxLevel)) return 0;
  return 129 + ap->rxLevel();
}

}  // namespace

bool Utility::sortWlans(gom::Variant* a, gom::Variant* b) { return rankOf(a) < rankOf(b); }

bool Utility::trimWlanCollection(unsigned int limit,
                                 gom::SharedPointer<gom::ValueCollection> collection) {
  if (!collection) return false;
  const unsigned int size = collection->size();
  if (size <= limit) return true;
  // Each rank is worked out once, then the entries are sorted by it.
  std::vector<std::pair<int, gom::Variant*>> ranked;
  try {
    ranked.reserve(size);
  } catch (const std::bad_alloc&) {
    return false;
  }
  for (gom::Variant* entry : *collection) ranked.emplace_back(rankOf(entry), entry);
  std::stable_sort(ranked.begin(), ranked.end(),
                   [](const auto& x, const auto& y) { return x.first < y.first; });
  // The survivors first, in ascending rank, then the dropped entries, which
  // are released from the back.
  const unsigned int dropped = size - limit;
  auto slot = collection->begin();
  for (unsigned int i = dropped; i < size; ++i) *slot++ = ranked[i].second;
  for (unsigned int i = 0; i < dropped; ++i) *slot++ = ranked[i].second;
  while (collection->size() > limit) collection->removeAt(collection->size() - 1);
  return true;
}

}  // namespace schema
}  // namespace lodestack
