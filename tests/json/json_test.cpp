// What is read, what is refused and how it is said, and what is written.
#include <orv/json.hpp>

#include <gtest/gtest.h>

#include <string>

#include <orv/all_messages.hpp>
#include "tests/testing/heap.hpp"
#include "tests/testing/hex.hpp"

namespace orv::test {
namespace {

// What the document is read as, encoded, or else the error's message.
template <class M>
std::string outcome(std::string_view document) {
  const auto message = json::parse<M>(document);
  return message ? toHex(message->serialize().value()) : message.error().message();
}

struct Case {
  std::string_view name;
  std::string_view document;
  std::string_view outcome;
};

TEST(Json, ReadsEnvelopes) {
  const Case cases[] = {
      {"nothing", R"({})", ""},
      {"white space around", " \t\r\n{ } \n", ""},
      {"present at their defaults", R"({"version":0,"type":"unknown","data":""})", "08 00 10 00 1A 00"},
      {"null is absent", R"({"version":null,"type":null,"data":null})", ""},
      {"out of order", R"({"data":"AQ==","version":1})", "08 01 1A 01 01"},
      {"number", R"({"version":4294967295})", "08 FF FF FF FF 0F"},
      {"number as a float", R"({"version":1.0})", "08 01"},
      {"number with an exponent", R"({"version":1e2})", "08 64"},
      {"number that an exponent makes whole", R"({"version":25e-1,"version2":0})",
       "$.version: expected a whole number from 0 to 4294967295, found another number"},
      {"number as a string", R"({"version":"4294967295"})", "08 FF FF FF FF 0F"},
      {"minus zero", R"({"version":-0})", "08 00"},
      {"number too large", R"({"version":4294967296})",
       "$.version: expected a whole number from 0 to 4294967295, found another number"},
      {"number far too large", R"({"version":18446744073709551616})",
       "$.version: expected a whole number from 0 to 4294967295, found another number"},
      {"negative number", R"({"version":-1})",
       "$.version: expected a whole number from 0 to 4294967295, found another number"},
      {"fraction", R"({"version":0.5})",
       "$.version: expected a whole number from 0 to 4294967295, found another number"},
      {"number beyond 63 bits", R"({"version":9223372036854775808})",
       "$.version: expected a whole number from 0 to 4294967295, found another number"},
      {"number far too small", R"({"version":-1e30})",
       "$.version: expected a whole number from 0 to 4294967295, found another number"},
      {"string with more than digits", R"({"version":" 1"})",
       "$.version: expected a whole number from 0 to 4294967295, found \" 1\""},
      {"string with more behind the digits", R"({"version":"1 "})",
       "$.version: expected a whole number from 0 to 4294967295, found \"1 \""},
      {"string of forty bytes", R"({"version":"4444444444444444444444444444444444444444"})",
       "$.version: expected a whole number from 0 to 4294967295, found "
       "\"4444444444444444444444444444444444444444\""},
      {"string of more", R"({"version":"44444444444444444444444444444444444444444"})",
       "$.version: expected a whole number from 0 to 4294967295, found a string of 41 bytes"},
      {"string too large", R"({"version":"4294967296"})",
       "$.version: expected a whole number from 0 to 4294967295, found \"4294967296\""},
      {"empty string for a number", R"({"version":""})",
       "$.version: expected a whole number from 0 to 4294967295, found \"\""},
      {"boolean for a number", R"({"version":true})",
       "$.version: expected a whole number from 0 to 4294967295, found a boolean"},
      {"enumeration by name", R"({"type":"groupMessage"})", "10 05"},
      {"enumeration by number", R"({"type":5})", "10 05"},
      {"enumeration without a name", R"({"type":9})", "10 09"},
      {"negative enumeration", R"({"type":-1})", "10 FF FF FF FF FF FF FF FF FF 01"},
      {"enumeration beyond 32 bits", R"({"type":2147483648})",
       "$.type: expected a name or a whole number of 32 bits, found another number"},
      {"enumeration between two numbers", R"({"type":0.5})",
       "$.type: expected a name or a whole number of 32 bits, found another number"},
      {"enumeration misspelled", R"({"type":"groupmesage"})",
       "$.type: unknown name \"groupmesage\" (did you mean \"groupMessage\"?)"},
      {"enumeration of another kind", R"({"type":[]})", "$.type: expected a name or a number, found a list"},
      {"bytes", R"({"data":"+/+/AA=="})", "1A 04 FB FF BF 00"},
      {"bytes in the other alphabet", R"({"data":"-_-_AA=="})", "1A 04 FB FF BF 00"},
      {"bytes without padding", R"({"data":"-_-_AA"})", "1A 04 FB FF BF 00"},
      {"bytes with a line end in them", R"({"data":"AQ\n=="})", "$.data: expected base64, found \"AQ\n==\""},
      {"bytes with too little padding", R"({"data":"AQ="})", "$.data: expected base64, found \"AQ=\""},
      {"bytes with one digit too many", R"({"data":"AQIDB"})", "$.data: expected base64, found \"AQIDB\""},
      {"number for bytes", R"({"data":1})", "$.data: expected a base64 string, found a number"},
      {"no object", R"([])", "$: expected an object, found a list"},
      {"null", R"(null)", "$: expected an object, found null"},
      {"unknown field", R"({"vresion":1})", "$.vresion: unknown field (did you mean \"version\"?)"},
      {"unknown field, absent", R"({"vresion":null})",
       "$.vresion: unknown field (did you mean \"version\"?)"},
      {"a name in another letter case", R"({"Version":1})",
       "$.Version: unknown field (did you mean \"version\"?)"},
      {"a name like no other", R"({"colour":1})", "$.colour: unknown field"},
      {"a name with a space", R"({"my version":1})",
       "$[\"my version\"]: unknown field (did you mean \"version\"?)"},
      {"the same name twice", R"({"version":1,"version":1})", "$.version: the object has this member twice"},
      {"the same name twice, spelled otherwise", R"({"version":1,"\u0076ersion":1})",
       "$.version: the object has this member twice"},
      {"the same unknown name twice", R"({"x":{"y":[0,{"z":1,"z":2}]}})",
       "$.x.y[1].z: the object has this member twice"},
      {"nothing at all", "", "line 1, column 1: expected a value, found the end"},
      {"two documents", "{}\n{}", "line 2, column 1: expected the end, found \"{\""},
      {"a comma too many", "{\"version\":1,\n \"type\":5,}",
       "line 2, column 11: expected a name in quotation marks, found \"}\""},
      {"no colon", R"({"version" 1})", "line 1, column 12: expected \":\", found a number"},
      {"no comma", R"({"version":1 "type":5})", "line 1, column 19: expected \",\" or \"}\", found a string"},
      {"no comma in a list", "[1 true]", "line 1, column 7: expected \",\" or \"]\", found true"},
      {"an end too early", R"({"version":)", "line 1, column 12: expected a value, found the end"},
      {"a string without an end", R"({"data":"AQ)",
       "line 1, column 12: a string without its closing quotation mark"},
      {"a line end in a string", "{\"data\":\"AQ\n\"}",
       "line 1, column 12: a control character in a string, which must be escaped"},
      {"an escape of another language", R"({"data":"\x41"})",
       "line 1, column 11: an escape that JSON does not have"},
      {"an escape that ends early", R"({"data":"\u41"})",
       "line 1, column 14: \\u without its four hexadecimal digits"},
      {"a number of another language", R"({"version":-x})", "line 1, column 13: no number"},
      {"a number too large for any", R"({"version":1e999})",
       "line 1, column 12: a number too large for a double"},
      {"ill-formed UTF-8", "{\"data\":\"\xFF\"}", "line 1, column 10: ill-formed UTF-8"},
      {"half a surrogate pair", R"({"data":"\uD800"})", "line 1, column 16: half a surrogate pair"},
      {"columns are characters", "{\"é\": x}", "line 1, column 7: expected a value, found another word"},
      {"NUL between members", {"{\0}", 3}, "line 1, column 2: a NUL character"},
      {"NUL behind the document", {"{}\n\0{", 5}, "line 2, column 1: a NUL character"},
      {"NUL in a string", {"{\"data\":\"\0\"}", 12}, "line 1, column 10: a NUL character"},
  };
  for (const Case& each : cases) EXPECT_EQ(outcome<SessionMessage>(each.document), each.outcome) << each.name;
}

TEST(Json, ReadsGroups) {
  const Case cases[] = {
      {"list of messages", R"({"initialize":{"groupUUID":"AQ","members":[{"handle":"a"},{}]}})",
       "0A 0A 0A 01 01 12 03 0A 01 61 12 00"},
      {"oneof member at its default", R"({"memberLeft":{}})", "22 00"},
      {"oneof member that is null", R"({"memberLeft":{},"initialize":null})", "22 00"},
      {"second member of a oneof", R"({"memberLeft":{},"initialize":{}})",
       "$.initialize: a second member of a oneof"},
      {"boolean", R"({"memberLeft":{"usesToken":true}})", "22 02 10 01"},
      {"boolean as a string", R"({"memberLeft":{"usesToken":"true"}})",
       "$.memberLeft.usesToken: expected true or false, found a string"},
      {"a name of the accessor", R"({"memberLeft":{"groupUuid":""}})",
       "$.memberLeft.groupUuid: unknown field (did you mean \"groupUUID\"?)"},
      {"deep in a list", R"({"initialize":{"members":[{"handle":"a"},{"hndle":"b"}]}})",
       "$.initialize.members[1].hndle: unknown field (did you mean \"handle\"?)"},
      {"null in a list", R"({"initialize":{"members":[{},null]}})",
       "$.initialize.members[1]: expected an object, found null"},
      {"null for a list", R"({"initialize":{"members":null}})", "0A 00"},
      {"object for a list", R"({"initialize":{"members":{}}})",
       "$.initialize.members: expected a list, found an object"},
      {"text for a message", R"({"initialize":"x"})", "$.initialize: expected an object, found a string"},
  };
  for (const Case& each : cases) EXPECT_EQ(outcome<Group>(each.document), each.outcome) << each.name;
}

TEST(Json, ReadsTexts) {
  using Approval = JoinResponse::Content::ApprovalContent;
  const Case cases[] = {
      {"list", R"({"memberHandles":["a","","\u00e9\u0000"]})", "12 01 61 12 00 12 03 C3 A9 00"},
      {"number in a list", R"({"memberHandles":["a",1]})",
       "$.memberHandles[1]: expected a string, found a number"},
      {"escapes", R"({"sessionIdentifier":"\"\\\/\b\f\n\r\t\uD83D\uDE00"})",
       "0A 0C 22 5C 2F 08 0C 0A 0D 09 F0 9F 98 80"},
      {"implicit presence at its default", R"({"sessionIdentifier":""})", ""},
      {"boolean for a text", R"({"sessionIdentifier":false})",
       "$.sessionIdentifier: expected a string, found a boolean"},
  };
  for (const Case& each : cases) EXPECT_EQ(outcome<Approval>(each.document), each.outcome) << each.name;
}

TEST(Json, ShowsNamesInPathsAsTheyAreSpelled) {
  const std::pair<std::string, std::string> cases[] = {
      {"azAZ09_", ".azAZ09_"}, {"", R"([""])"},   {"`", R"(["`"])"}, {"{", R"(["{"])"},
      {"@", R"(["@"])"},       {"[", R"(["["])"}, {"/", R"(["/"])"}, {":", R"([":"])"},
  };
  for (const auto& [name, step] : cases)
    EXPECT_EQ(outcome<Group>("{\"" + name + "\":0}"), "$" + step + ": unknown field");
}

TEST(Json, RefusesWhatItsLimitsDoNotAllow) {
  const struct {
    std::string_view document;
    DecodeLimits limits;  // one less than it needs
    std::size_t DecodeLimits::*limit;
    std::string_view error;
  } cases[] = {
      {R"({"memberLeft":{}})",
       {.inputBytes = 16},
       &DecodeLimits::inputBytes,
       "$: more bytes of input than the limit of 16 allows"},
      {"{}", {.listElements = 0}, &DecodeLimits::listElements, "$: more values than the limit of 0 allows"},
      {R"({"initialize":{"groupUUID":"AQ","members":[{},{}]}})",
       {.listElements = 5},
       &DecodeLimits::listElements,
       "$.initialize.members[1]: more values than the limit of 5 allows"},
      {R"({"memberLeft":{"usesToken":true}})",
       {.listElements = 2},
       &DecodeLimits::listElements,
       "$.memberLeft.usesToken: more values than the limit of 2 allows"},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.error);
    const auto refused = json::parse<Group>(row.document, row.limits);
    ASSERT_FALSE(refused);
    EXPECT_EQ(::testing::PrintToString(refused.error()), row.error);
    DecodeLimits enough = row.limits;
    ++(enough.*row.limit);
    EXPECT_TRUE(json::parse<Group>(row.document, enough));
  }
}

TEST(Json, GivesADocumentAway) {
  auto first = json::Document::parse("[1]").value(), second = json::Document::parse("true").value();
  first = std::move(second);
  EXPECT_TRUE(first.root().boolean());
}

TEST(Json, KeepsWhatWasReadBeforeAnError) {
  const auto document = json::Document::parse(R"({"handle":"a","tokenID":1})");
  ASSERT_TRUE(document.has_value());
  json::DocumentDecoder decoder(document->root());
  Member member;
  EXPECT_FALSE(member.decodeMessage(decoder).has_value());
  EXPECT_EQ(member.handle(), "a");
}

TEST(Json, RefusesDeepNestingAndLongInputInTime) {
  const std::string open(1'000'000, '[');
  const std::string deep = outcome<Group>(open);
  EXPECT_TRUE(deep.ends_with(": nested deeper than 100")) << deep;
  std::string many = "{";
  for (int index = 0; index < 200'000; ++index) many += "\"" + std::to_string(index) + "\":0,";
  EXPECT_EQ(outcome<Group>(many + "\"7\":0}"), "$.7: the object has this member twice");
  EXPECT_EQ(outcome<Group>(many + "\"x\":0}"), "$.0: unknown field");
  std::string outside, inside;
  for (int level = 0; level < 90; ++level) {
    outside += "{\"" + std::string(50, 'n') + "\":";
    inside += '}';
  }
  const std::string twice = outcome<Group>(outside + "{\"x\":0,\"x\":0}" + inside);
  EXPECT_LT(twice.size(), 300U);
  EXPECT_TRUE(twice.starts_with("$…n")) << twice;
  const std::string name(100'000, 'n');
  EXPECT_EQ(outcome<Group>("{\"" + name + "\":0}"), "$[\"" + name.substr(0, 60) + "…\"]: unknown field");
}

template <class M>
std::string rendered(std::string_view bytes, json::RenderOptions options = {}) {
  return json::render(M::parse(hex(bytes)).value(), options);
}

TEST(Json, IsRenderedInOneLineOrIndented) {
  const std::string_view group = "0A 0B 0A 01 FB 12 04 0A 02 C3 A9 12 00";
  EXPECT_EQ(rendered<Group>(group), R"({"initialize":{"groupUUID":"+w==","members":[{"handle":"é"},{}]}})");
  EXPECT_EQ(rendered<Group>(group, {.isIndented = true}), R"({
  "initialize": {
    "groupUUID": "+w==",
    "members": [
      {
        "handle": "é"
      },
      {}
    ]
  }
})");
}

TEST(Json, ShowsNothingThatActsOnATerminal) {
  // Quote, backslash, escape, delete, a control character of two bytes, line and paragraph separators, the names.
  EXPECT_EQ(rendered<Member>("0A 10 22 5C 1B 7F C2 9B E2 80 A8 E2 80 A9 0D 0A 09 20"),
            R"({"handle":"\"\\\u001b\u007f\u009b\u2028\u2029\r\n\t "})");
  EXPECT_EQ(rendered<Member>("0A 04 C2 A0 C3 A9"), "{\"handle\":\"\u00A0\u00E9\"}");
  // Of what stands in no message nobody knows whether it is a secret.
  std::string output;
  json::Renderer renderer(output, {.hidesSecrets = true});
  EXPECT_TRUE(renderer.visitSingularBoolField(true, 7));
  EXPECT_NE(output.find(R"("7":"<redacted>")"), std::string::npos) << output;
}

TEST(Json, ShowsUnknownFieldsOnDemand) {
  const std::string_view bytes =
      "0A 01 61 38 96 01 45 01 00 00 00 49 02 00 00 00 00 00 00 00 52 01 FF 5B 08 01 5C";
  EXPECT_EQ(rendered<Member>(bytes), R"({"handle":"a"})");
  EXPECT_EQ(
      rendered<Member>(bytes, {.showsUnknownFields = true}),
      R"({"handle":"a","unknownFields":[)"
      R"({"number":7,"wireType":"varint","value":"150"},)"
      R"({"number":8,"wireType":"fixed32","value":1},)"
      R"({"number":9,"wireType":"fixed64","value":"2"},)"
      R"({"number":10,"wireType":"lengthDelimited","value":"/w=="},)"
      R"({"number":11,"wireType":"startGroup","value":[{"number":1,"wireType":"varint","value":"1"}]}]})");
}

TEST(Json, HidesSecretsOnDemand) {
  EXPECT_EQ(rendered<Member>("0A 01 61 12 01 62 48 05 50 81 00",
                             {.showsUnknownFields = true, .hidesSecrets = true}),
            R"({"handle":"a","tokenID":"<redacted>","unknownFields":[)"
            R"({"number":9,"wireType":"varint","value":"<redacted>"},)"
            R"({"number":10,"wireType":"varint","value":"<redacted>"}]})");
}

TEST(Json, LeaksNothingWhereverMemoryRunsOut) {
  const std::string longName(50, 'n');
  const std::string documents[] = {
      R"({"initialize":{"groupUUID":"AQID","members":[{"handle":")" + longName +
          R"("},{},{"tokenID":"a"}]}})",
      R"({"initialize":{"members":[[[1.5,{"a":[null,true]}]]]}})",
      R"({"initialize":{},")" + longName + R"(":{"x":[1,2,3]}})",
      R"({"memberAdded":{"member":{"handle":"a","handle":)",
      R"({"memberLeft":{"usesToken":[[[{"a":[)" + longName,
  };
  for (const std::string& document : documents) {
    SCOPED_TRACE(document);
    const auto nothing = [](auto&&...) { return 0; };
    EXPECT_GT(runOutOfMemory(
                  nothing, [&](int) { (void)json::parse<Group>(document); }, nothing),
              5U);
    const auto group = json::parse<Group>(document);
    if (!group) continue;
    EXPECT_GT(runOutOfMemory(
                  nothing, [&](int) { (void)json::render(*group); }, nothing),
              1U);
  }
}

TEST(Json, ShowsEachUnknownFieldOnALine) {
  EXPECT_EQ(rendered<Member>("0A 01 61 20 01 5B 08 01 5C", {.isIndented = true, .showsUnknownFields = true}),
            R"({
  "handle": "a",
  "unknownFields": [
    {"number":4,"wireType":"varint","value":"1"},
    {"number":11,"wireType":"startGroup","value":[{"number":1,"wireType":"varint","value":"1"}]}
  ]
})");
}

TEST(Json, ReadsUnknownFieldsByteForByte) {
  // In groups, and spelled longer than need be: the number, the tag, the length, in a group.
  for (const std::string_view bytes :
       {"0A 01 61 38 96 01 45 01 00 00 00 49 02 00 00 00 00 00 00 00 52 01 FF 5B 08 01 5C",
        "38 FF FF FF FF FF FF FF FF FF 01", "38 81 00", "B8 00 01", "52 81 00 FF", "5B 08 81 00 5C",
        "5B 5B 5C DC 00", "08 01 15 00 00 00 80"}) {
    const std::string document = rendered<Member>(bytes, {.showsUnknownFields = true});
    EXPECT_EQ(outcome<Member>(document), bytes) << document;
  }
}

TEST(Json, RefusesUnknownFieldsThatAreNone) {
  const Case cases[] = {
      {"no list", "{}", "$.unknownFields: expected a list, found an object"},
      {"no object", "[1]", "$.unknownFields[0]: expected an object, found a number"},
      {"another member", R"([{"size":1}])", "$.unknownFields[0]: an unknown field has no \"size\""},
      {"no number", R"([{"wireType":"varint","value":1}])",
       "$.unknownFields[0]: \"number\" is no number of a field"},
      {"number 0", R"([{"number":0}])", "$.unknownFields[0]: \"number\" is no number of a field"},
      {"number too large", R"([{"number":536870912}])",
       "$.unknownFields[0]: \"number\" is no number of a field"},
      {"no type", R"([{"number":9}])", "$.unknownFields[0]: \"wireType\" is none"},
      {"end of a group", R"([{"number":9,"wireType":"endGroup"}])",
       "$.unknownFields[0]: \"wireType\" is none"},
      {"no value", R"([{"number":9,"wireType":"varint"}])", "$.unknownFields[0]: \"value\" is no varint"},
      {"negative value", R"([{"number":9,"wireType":"varint","value":-1}])",
       "$.unknownFields[0]: \"value\" is no varint"},
      {"value between two numbers", R"([{"number":9,"wireType":"varint","value":0.5}])",
       "$.unknownFields[0]: \"value\" is no varint"},
      {"value with more than digits", R"([{"number":9,"wireType":"varint","value":"1 "}])",
       "$.unknownFields[0]: \"value\" is no varint"},
      {"value of 65 bits", R"([{"number":9,"wireType":"varint","value":"18446744073709551616"}])",
       "$.unknownFields[0]: \"value\" is no varint"},
      {"no fixed value", R"([{"number":9,"wireType":"fixed64"}])",
       "$.unknownFields[0]: \"value\" is out of range"},
      {"value too large", R"([{"number":9,"wireType":"fixed32","value":4294967296}])",
       "$.unknownFields[0]: \"value\" is out of range"},
      {"no base64", R"([{"number":9,"wireType":"lengthDelimited","value":"!"}])",
       "$.unknownFields[0]: \"value\" is no base64"},
      {"no bytes", R"([{"number":9,"wireType":"lengthDelimited"}])",
       "$.unknownFields[0]: \"value\" is no base64"},
      {"a number for bytes", R"([{"record":1}])", "$.unknownFields[0]: \"record\" is no base64"},
      {"no base64 in a record", R"([{"record":"!"}])", "$.unknownFields[0]: \"record\" is no base64"},
      {"a number for a type", R"([{"number":9,"wireType":0}])", "$.unknownFields[0]: \"wireType\" is none"},
      {"no value of a group", R"([{"number":9,"wireType":"startGroup"}])",
       "$.unknownFields[0]: \"value\" is no list"},
      {"a mistake in a group", R"([{"number":9,"wireType":"startGroup","value":[0]}])",
       "$.unknownFields[0]: expected an object, found a number"},
      {"no group", R"([{"number":9,"wireType":"startGroup","value":""}])",
       "$.unknownFields[0]: \"value\" is no list"},
      {"malformed record", R"([{"record":"Cg=="}])",
       "$.unknownFields[0]: malformed: the input ends inside a record"},
      {"known field", R"([{"number":1,"wireType":"lengthDelimited","value":"/w=="}])",
       "$.unknownFields[0]: field 1 is handle"},
      {"largest number", R"([{"number":9,"wireType":"varint","value":9223372036854775807}])",
       "48 FF FF FF FF FF FF FF FF 7F"},
      {"number above it", R"([{"number":9,"wireType":"varint","value":9223372036854775808}])",
       "$.unknownFields[0]: \"value\" is no varint"},
      {"null", "null", ""},
  };
  for (const Case& each : cases)
    EXPECT_EQ(outcome<Member>("{\"unknownFields\":" + std::string(each.document) + "}"), each.outcome)
        << each.name;
}

}  // namespace
}  // namespace orv::test
