// Plays the scanner for tests of its launcher: takes the scan list's path as the scanner does and carries out
// one line of the file "stand-in" in the data folder for each run, the last one again and again. Words of a
// line:
//   marker=NAME   writes a crash marker of VST 2 (NAME has its ending)
//   clear         deletes the markers A.scan and A.scan3 first
//   report        says in the report that the scan has come to its end
//   hang, fault, exit=N   how it ends (exit=0 without any)
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <thread>

namespace {

namespace fs = std::filesystem;

/// The line of this run; runs are counted in the file "runs".
std::string lineOfRun(const fs::path &data)
{
    std::ofstream(data / "runs", std::ios::app) << '\n';
    std::ifstream script(data / "stand-in"), runs(data / "runs");
    std::string line, last, run;
    while (std::getline(runs, run) && std::getline(script, line))
        last = line;
    return last;
}

void carryOut(const std::string &word, const fs::path &effects)
{
    const std::string value = word.substr(word.find('=') + 1);
    if (word == "clear")
        for (const char *marker : {"A.scan", "A.scan3"})
            fs::remove(effects / marker);
    else if (word == "fault")
        __builtin_trap(); // abort is no crash on Windows
    else if (word == "hang")
        std::this_thread::sleep_for(std::chrono::hours(1));
    else if (word == "report")
        std::ofstream(std::getenv("FXPROBE_REPORT"), std::ios::binary) << "{\"event\":\"finished\"}\n";
    else if (word.rfind("marker=", 0) == 0)
        std::ofstream(effects / value)
            << "<CrashedPlugin>\n\t<Path>/p/" << value << "</Path>\n</CrashedPlugin>\n";
    else if (word.rfind("exit=", 0) == 0)
        std::_Exit(std::stoi(value));
}

} // namespace

int main(int argc, char **argv)
{
    if (argc != 2)
        return 86;
    const fs::path effects = fs::path(argv[1]).parent_path();
    std::istringstream words(lineOfRun(effects.parent_path()));
    for (std::string word; words >> word;)
        carryOut(word, effects);
    return 0;
}
