// A measurement result as a JSON tree, the one form both printers render.
//
// The tree follows the schema and names every value by its schema name;
// only present values appear. Values are made readable on the way: BSSIDs
// as lower-case "aa:bb:cc:dd:ee:ff" text (all 8 bytes of an 8-byte one),
// coded coordinates in degrees (7 decimals), time stamps as ISO 8601 UTC
// text. Each measurement is one object: its identity's fields (mcc, mnc,
// lac, cid, ucid, bssid, ...) first, then timeStamp and the rest; a serving
// cell measurement shows its own values together with those of the network
// measurement it holds; a GNSS fix shows its position, uncertainty, speed
// (m/s) and course directly.
#ifndef LODESTACK_SCAN_MEASUREMENTTREE_H
#define LODESTACK_SCAN_MEASUREMENTTREE_H

#include <string>

#include <nlohmann/json.hpp>

#include "Result.h"

namespace lodestack {
namespace scan {

using Json = nlohmann::ordered_json;

// {"kind", "requestId", "status", "measurements"}; measurements is null when
// the result carries no container. Throws Status WrongObjectType when the
// object is not a measurement container the schema's classes can walk.
Json resultTree(const Result& result);

// The container's collections ("geran", "utraFdd", "utraTdd", "eutra",
// "cdma", "wlan", "gnss"), each a list of measurements; null for a null
// root. Throws like resultTree.
Json measurementTree(const gom::SharedPointer<gom::GenericObject>& root);

// "aa:bb:cc:dd:ee:ff": each byte as two lower-case hex digits.
std::string bssidText(const unsigned char* bytes, unsigned int length);
// "2024-05-01T12:00:00Z".
std::string isoTime(unsigned int secondsSinceEpoch);

}  // namespace scan
}  // namespace lodestack

#endif  // LODESTACK_SCAN_MEASUREMENTTREE_H
