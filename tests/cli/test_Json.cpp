// The JSON writer against the layout and escaping the tool's documents have
// always had (a general JSON library's two-blank pretty print, invalid UTF-8
// replaced), on random texts and a document with every kind of value.
#include "Json.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <cstdint>
#include <string>

using tsd_cli::JsonWriter;

namespace {

std::string reference(const nlohmann::ordered_json& doc) {
    return doc.dump(2, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
}

} // namespace

TEST(Json, StringsEscapeAndReplaceLikeTheReference) {
    // Bytes drawn mostly from the ones that matter: controls, quotes,
    // backslashes, lead and continuation bytes, and the edges of the valid
    // ranges of second bytes.
    const std::uint8_t pool[] = {'a',  ' ',  '"',  '\\', 0x00, 0x08, 0x09, 0x0A, 0x0C, 0x0D,
                                 0x1F, 0x7F, 0x80, 0x8F, 0x90, 0x9F, 0xA0, 0xBF, 0xC0, 0xC1,
                                 0xC2, 0xDF, 0xE0, 0xE1, 0xED, 0xEF, 0xF0, 0xF4, 0xF5, 0xFF};
    std::uint64_t state = 12345;
    auto next = [&state] {
        state = state * 6364136223846793005u + 1442695040888963407u;
        return static_cast<std::uint32_t>(state >> 33);
    };
    for (int round = 0; round < 20000; ++round) {
        std::string text;
        for (std::uint32_t n = next() % 12; n > 0; --n)
            text += static_cast<char>(pool[next() % sizeof pool]);
        std::string ours;
        tsd_cli::appendJsonString(ours, text);
        ASSERT_EQ(ours, reference(nlohmann::ordered_json(text))) << testing::PrintToString(text);
    }
}

TEST(Json, DocumentsAreLaidOutLikeTheReference) {
    std::string ours;
    JsonWriter json(ours);
    json.beginObject()
        .key("files")
        .strings({"a.props", "b\"c"})
        .key("empty")
        .beginArray()
        .endArray()
        .key("nothing")
        .beginObject()
        .endObject()
        .key("list")
        .beginArray()
        .beginObject()
        .member("file", "x")
        .key("line")
        .null()
        .member("n", -3)
        .key("details")
        .strings({})
        .endObject()
        .number(7)
        .boolean(true)
        .beginArray()
        .beginArray()
        .endArray()
        .endArray()
        .endArray()
        .endObject()
        .finish();

    nlohmann::ordered_json doc = {
        {"files", {"a.props", "b\"c"}},
        {"empty", nlohmann::ordered_json::array()},
        {"nothing", nlohmann::ordered_json::object()},
        {"list",
         {{{"file", "x"},
           {"line", nullptr},
           {"n", -3},
           {"details", nlohmann::ordered_json::array()}},
          7,
          true,
          {nlohmann::ordered_json::array()}}},
    };
    EXPECT_EQ(ours, reference(doc) + "\n");
}
