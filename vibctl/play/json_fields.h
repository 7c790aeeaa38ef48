// SPDX-License-Identifier: Apache-2.0
//
// The fields of a JSON object, read with their limits; the first thing that is wrong is kept, with
// its line, key and what is accepted.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include <json/value.h>

#include "vibctl/arguments.h"

namespace vibctl {

// Parses a whole document; a problem names the line. `firstLine` is that of the text's beginning.
Problem parseJson(const std::string& text, int firstLine, Json::Value& root);

class JsonFields {
  public:
    // Of `object`, which was parsed from `text`. The problem goes to `problem` unless there is one.
    JsonFields(const Json::Value& object, const std::string& text, int firstLine, Problem& problem);

    // Complains about every key that is not one of these.
    void expectKeys(const std::vector<std::string>& keys);

    // What is accepted is a number of these limits; `missing` when there is no such key.
    double number(const char* key, double lowest, double highest, double missing);

    std::string string(const char* key, const std::string& missing);

    // Nothing when there is no such key.
    std::optional<bool> boolean(const char* key);

    // A list, empty when there is no such key.
    const Json::Value& list(const char* key);

    void complain(const Json::Value& where, const std::string& what);
    int lineOf(const Json::Value& value) const;

  private:
    const Json::Value& mObject;
    const std::string& mText;
    int mFirstLine;
    Problem& mProblem;
};

}  // namespace vibctl
