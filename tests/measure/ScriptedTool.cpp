// In the place of the measuring tool: keeps its options file, takes its time, and leaves samples.
#include <chrono>
#include <cstdlib>
#include <fstream>
#include <string>
#include <thread>

int main(int argc, char** argv) {
    const char* const kept = std::getenv("SCRIPTED_TOOL_KEEPS");
    if (argc != 2 || kept == nullptr) {
        return 1;
    }
    std::ifstream options(argv[1]);
    std::ofstream copy(kept);
    std::string samples;
    bool isOutput = false;
    for (std::string line; std::getline(options, line);) {
        copy << line << '\n';
        if (isOutput) {
            samples = line;
        }
        isOutput = line == "-o";
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(2500));
    std::ofstream(samples) << "samples\n";
}
