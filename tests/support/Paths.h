/// Where the tests find what they were built with. Any thread.
#pragma once

#include <string>

namespace tests {

/// A movie, or a folder of movies, of tests/movies.
std::string movie(const std::string& name);

/// A program of this build.
std::string program(const std::string& name);

/// A file of the checkout, named from its top.
std::string sourceFile(const std::string& name);

} // namespace tests
