#include "Location.h"

#include <cstdio>
#include <ctime>

#include <lodestack/schema/utility/Utility.h>

namespace lodestack {
namespace scan {
namespace {

using schema::PositionEstimate;

// The error message of the services' error body; empty when there is none.
std::string messageOf(const std::string& body) {
  const Json answer = Json::parse(body, nullptr, false);
  if (!answer.is_object()) return std::string();
  const auto error = answer.find("error");
  if (error == answer.end() || !error->is_object()) return std::string();
  const auto message = error->find("message");
  if (message == error->end() || !message->is_string()) return std::string();
  // One line of reasonable length, whatever the service wrote.
  constexpr std::size_t kLongest = 300;
  std::string text = message->get<std::string>().substr(0, kLongest);
  for (char& c : text) {
    if (static_cast<unsigned char>(c) < 0x20) c = ' ';
  }
  return text;
}

// The number under `key` of `object`, if it is one.
std::optional<double> numberAt(const Json& object, const char* key) {
  const auto it = object.find(key);
  if (it == object.end() || !it->is_number()) return std::nullopt;
  return it->get<double>();
}

std::string notAPosition(const char* why) {
  return std::string("the answer is not a position: ") + why;
}

bool readPosition(const std::string& body, Location& location, std::string& error) {
  const Json answer = Json::parse(body, nullptr, false);
  if (answer.is_discarded()) {
    error = notAPosition("not JSON");
    return false;
  }
  const auto where = answer.is_object() ? answer.find("location") : answer.end();
  if (!answer.is_object() || where == answer.end() || !where->is_object()) {
    error = notAPosition("no \"location\" object");
    return false;
  }
  const std::optional<double> lat = numberAt(*where, "lat");
  std::optional<double> lng = numberAt(*where, "lng");
  const std::optional<double> accuracy = numberAt(answer, "accuracy");
  if (!lat || !lng) {
    error = notAPosition("no numeric \"lat\" and \"lng\"");
    return false;
  }
  if (!accuracy || !(*accuracy > 0)) {
    error = notAPosition("no \"accuracy\" above 0");
    return false;
  }
  if (*lng == 180) lng = -180.0;
  const gom::SharedPointer<PositionEstimate> position = PositionEstimate::create(
      *lat, *lng, *accuracy * kCepPerAccuracyMetre, static_cast<unsigned int>(std::time(nullptr)));
  if (!position) {
    error = notAPosition("latitude, longitude or accuracy out of range");
    return false;
  }
  position->setSource(PositionEstimate::SourceInjection);
  location.position = position;
  location.accuracy = *accuracy;
  return true;
}

struct Comparison {
  double distance = 0;
  bool inside = false;
};

Comparison compare(const Location& location, const Fix& fix) {
  Comparison c;
  schema::Utility::distance(location.position->latitude(), location.position->longitude(),
                            fix.latitude, fix.longitude, c.distance);
  c.inside = c.distance <= location.accuracy;
  return c;
}

std::string decimals(double value, int places) {
  char text[64];
  std::snprintf(text, sizeof text, "%.*f", places, value);
  return text;
}

}  // namespace

bool readAnswer(long status, const std::string& body, Location& location, std::string& error) {
  if (status == 200) return readPosition(body, location, error);
  // The services' only 404 is their notFound: nothing known about these
  // measurements.
  if (status == 404) {
    error = "no position for these measurements";
    return false;
  }
  const std::string message = messageOf(body);
  error = "the service answered HTTP " + std::to_string(status) +
          (message.empty() ? std::string() : ": " + message);
  return false;
}

Json locationJson(const Location& location, const std::optional<Fix>& fix) {
  Json out = Json::object();
  out["kind"] = "location";
  out["latitude"] = location.position->latitude();
  out["longitude"] = location.position->longitude();
  out["accuracy"] = location.accuracy;
  out["horizontalCepUncertainty"] = location.position->horizontalCepUncertainty();
  if (fix) {
    const Comparison c = compare(location, *fix);
    out["distance"] = c.distance;
    out["inside"] = c.inside;
  }
  return out;
}

std::string locationText(const Location& location, const std::optional<Fix>& fix) {
  std::string text = "location: latitude " + decimals(location.position->latitude(), 7) +
                     ", longitude " + decimals(location.position->longitude(), 7) + ", accuracy " +
                     decimals(location.accuracy, 1) + " m";
  if (fix) {
    const Comparison c = compare(location, *fix);
    text += "; " + decimals(c.distance, 1) + " m from the GNSS fix, " +
            (c.inside ? "inside" : "outside") + " the accuracy circle";
  }
  return text + "\n";
}

}  // namespace scan
}  // namespace lodestack
