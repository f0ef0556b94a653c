#pragma once

#include <gtest/gtest.h>

#include <cctype>
#include <ostream>
#include <string>

// Table rows carry a `name` that says the behaviour, in words: it names the
// test (letters and digits, the rest "_") and is what a failure prints.
template <typename Row> std::string rowName(const ::testing::TestParamInfo<Row> &info)
{
    std::string name = info.param.name;
    for (char &c : name)
        c = std::isalnum(static_cast<unsigned char>(c)) ? c : '_';
    return name;
}
