// Runs a program and gives its output and its exit status.
#pragma once

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <system_error>
#include <vector>

// A temporary folder, removed with this object.
class Folder {
public:
    Folder()
    {
        std::string name = (std::filesystem::temp_directory_path() / "inventoryXXXXXX").string();
        if (mkdtemp(name.data()) == nullptr)
            throw std::system_error(errno, std::generic_category(), "no folder " + name);
        path_ = name;
    }
    ~Folder() { std::filesystem::remove_all(path_); }
    Folder(const Folder&) = delete;
    Folder& operator=(const Folder&) = delete;

    std::string path(const std::string& name) const { return (path_ / name).string(); }

    std::string write(const std::string& name, const std::string& text) const
    {
        std::ofstream file(path_ / name, std::ios::binary);
        if (!(file << text).flush())
            throw std::system_error(errno, std::generic_category(), "cannot write " + path(name));
        return path(name);
    }

private:
    std::filesystem::path path_;
};

inline std::string contentOf(const std::string& name)
{
    std::ifstream file(name, std::ios::binary);
    if (!file)
        throw std::runtime_error("cannot read " + name);
    std::stringstream content;
    content << file.rdbuf();
    return content.str();
}

// The export of a machine with one thread, with these facts about it and these objects in it.
inline std::string machineOf(const std::string& facts, const std::string& objects = "")
{
    const std::string sets = " cpuset=\"0x1\" complete_cpuset=\"0x1\" allowed_cpuset=\"0x1\" nodeset=\"0x1\""
                             " complete_nodeset=\"0x1\" allowed_nodeset=\"0x1\"";
    return "<topology version=\"2.0\"><object type=\"Machine\"" + sets + ">" + facts
        + "<object type=\"NUMANode\" os_index=\"0\"" + sets + "/><object type=\"PU\" os_index=\"0\"" + sets
        + "/>" + objects + "</object></topology>";
}

inline std::string fact(const std::string& name, const std::string& value)
{
    return "<info name=\"" + name + "\" value=\"" + value + "\"/>";
}

struct Outcome {
    int status;
    std::string out;
    std::string err;
};

// The words as a command of the shell.
inline std::string quoted(const std::vector<std::string>& words)
{
    std::string command;
    for (const std::string& word : words) {
        command += '\'';
        for (const char character : word)
            command += character == '\'' ? "'\\''" : std::string(1, character);
        command += "' ";
    }
    return command;
}

inline Outcome runProgram(const std::vector<std::string>& words)
{
    const Folder folder;
    const std::string out = folder.path("out");
    const std::string err = folder.path("err");
    const int status = std::system((quoted(words) + '>' + quoted({out}) + "2>" + quoted({err})).c_str());
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, contentOf(out), contentOf(err)};
}

// On a full device.
inline Outcome runWithoutSpace(const std::vector<std::string>& words)
{
    return runProgram({"sh", "-c", quoted(words) + ">/dev/full"});
}

inline std::vector<std::string> linesOf(const std::string& text)
{
    std::vector<std::string> lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);)
        lines.push_back(line);
    return lines;
}

#ifdef PYTHON
// The output of a Python program that reads the file. The program fails if the file is not valid.
inline std::string readByPython(const std::string& program, const std::string& file)
{
    const Outcome outcome = runProgram({PYTHON, "-c", program, file});
    EXPECT_EQ(outcome.status, 0) << outcome.err;
    return outcome.out;
}
#endif

#ifdef IC_TEST_TOPOLOGIES
constexpr const char* whyNoMachines =
    "no folder with exports of real machines (CMake variable IC_TEST_TOPOLOGIES)";

// The files with exports of real machines; empty if there is no folder of them.
inline std::vector<std::string> realMachines()
{
    std::vector<std::string> files;
    std::istringstream folders(IC_TEST_TOPOLOGIES);
    for (std::string folder; std::getline(folders, folder, ':');)
        for (const auto& file : std::filesystem::directory_iterator(folder))
            if (file.path().extension() == ".xml")
                files.push_back(file.path());
    std::sort(files.begin(), files.end());
    return files;
}

// The file of one machine. Throws if there is none.
inline std::string realMachine(const std::string& name)
{
    for (const std::string& file : realMachines())
        if (std::filesystem::path(file).stem() == name)
            return file;
    throw std::runtime_error("no machine " + name);
}
#endif
