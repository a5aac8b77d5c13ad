// A geolocation service's answers read as positions or one-line errors, and
// the service's address with its key.
#include <gtest/gtest.h>

#include <string>

#include "GeolocationService.h"
#include "Location.h"

namespace lodestack {
namespace scan {
namespace {

TEST(Location, AnswersOfTheServices) {
  // The antimeridian's east side is the record's west side.
  Location location;
  std::string error;
  ASSERT_TRUE(readAnswer(200, R"({"location": {"lat": -17, "lng": 180}, "accuracy": 9.5})",
                         location, error))
      << error;
  EXPECT_DOUBLE_EQ(-17, location.position->latitude());
  EXPECT_DOUBLE_EQ(-180, location.position->longitude());
  EXPECT_DOUBLE_EQ(9.5, location.accuracy);
  EXPECT_NEAR(9.5 * 0.48101, location.position->horizontalCepUncertainty(), 1e-9);
  EXPECT_TRUE(location.position->valueExists(schema::PositionEstimate::TimeStamp));

  struct Case {
    long status;
    const char* body;
    const char* error;
  };
  const Case failures[] = {
      {429, R"({"error": {"code": 429, "message": "Slow down", "errors": [{"reason": "x"}]}})",
       "the service answered HTTP 429: Slow down"},
      {400, R"({"error": {"code": 400, "message": "Parse\nError"}})",
       "the service answered HTTP 400: Parse Error"},
      {403, R"({"error": "keyInvalid"})", "the service answered HTTP 403"},
      {503, "<html>busy</html>", "the service answered HTTP 503"},
      {200, "[1, 2]", "the answer is not a position: no \"location\" object"},
      {200, R"({"location": {"lat": "1", "lng": 2}, "accuracy": 3})",
       "the answer is not a position: no numeric \"lat\" and \"lng\""},
      {200, R"({"location": {"lat": 1, "lng": 2}})",
       "the answer is not a position: no \"accuracy\" above 0"},
      {200, R"({"location": {"lat": 1, "lng": 2}, "accuracy": 0})",
       "the answer is not a position: no \"accuracy\" above 0"},
      {200, R"({"location": {"lat": 91, "lng": 2}, "accuracy": 3})",
       "the answer is not a position: latitude, longitude or accuracy out of range"},
      {200, R"({"location": {"lat": 1, "lng": -180.5}, "accuracy": 3})",
       "the answer is not a position: latitude, longitude or accuracy out of range"},
  };
  for (const Case& c : failures) {
    Location untouched;
    EXPECT_FALSE(readAnswer(c.status, c.body, untouched, error)) << c.body;
    EXPECT_EQ(c.error, error) << c.status << " " << c.body;
    EXPECT_FALSE(untouched.position) << c.body;
  }
}

TEST(Location, PrintedWithTheDistanceToTheFix) {
  Location location;
  std::string error;
  ASSERT_TRUE(
      readAnswer(200, R"({"location": {"lat": 0, "lng": 0}, "accuracy": 100})", location, error));
  // One thousandth of a degree along the equator: 111.2 m on the sphere of
  // radius 6371010 m.
  EXPECT_EQ(
      "location: latitude 0.0000000, longitude 0.0000000, accuracy 100.0 m; "
      "111.2 m from the GNSS fix, outside the accuracy circle\n",
      locationText(location, Fix{0, 0.001}));
}

TEST(GeolocationService, TheKeyJoinsTheQuery) {
  EXPECT_EQ("https://h/v1/geolocate", serviceUrl("https://h/v1/geolocate", ""));
  EXPECT_EQ("https://h/v1/geolocate?key=abc", serviceUrl("https://h/v1/geolocate", "abc"));
  EXPECT_EQ("https://h/v1/geolocate?a=1&key=abc", serviceUrl("https://h/v1/geolocate?a=1", "abc"));
  EXPECT_EQ("http://h/?key=a-b_c.d~e%2Bf%2F%3D%26%20%C3%A9",
            serviceUrl("http://h/", "a-b_c.d~e+f/=& \xC3\xA9"));
}

}  // namespace
}  // namespace scan
}  // namespace lodestack
