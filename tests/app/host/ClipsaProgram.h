/// What the tests of the commands without a window share: they run `clipsa` as a program, on the test movies.
#pragma once

#include "app/host/MediaCommandLine.h"
#include "support/Names.h"
#include "support/Paths.h"
#include "support/Program.h"

#include <QJsonDocument>
#include <QJsonObject>
#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace tests {

using Words = std::vector<std::string>;

/// What the command line makes of `words`, which it must take.
template <typename Command> Command parsed(const Words& words)
{
    const auto command = host::parseMediaCommand(words);
    EXPECT_TRUE(command) << command.error()->description();
    return std::get<Command>(command.value().value());
}

inline std::string refusal(const Words& words)
{
    const auto command = host::parseMediaCommand(words);
    return command ? "(accepted)" : command.error()->description();
}

class ClipsaProgram : public ::testing::Test {
protected:
    /// Its exit status; what it prints is kept. `words` begin with the command.
    int run(const Words& words, const Program::Variables& variables = {})
    {
        Program program(command(words), variables);
        const int status = program.wait();
        printed = program.output();
        errors = program.errors();
        return status;
    }

    static Words command(Words words)
    {
        words.insert(words.begin(), tests::program("clipsa"));
        return words;
    }

    /// What `clipsa probe` says of a movie.
    static QJsonObject probe(const std::string& path)
    {
        Program program(command({"probe", path, "--json"}), {});
        EXPECT_EQ(program.wait(), 0) << program.errors();
        return QJsonDocument::fromJson(QByteArray::fromStdString(program.output())).object();
    }

    PrivateDirectory directory;
    const std::string out = directory.path() / "out.mp4";
    std::string printed;
    std::string errors;
};

} // namespace tests
