// Runs the unit tests in a folder of their own, which stands in for the unit's root.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>

int main(int argc, char** argv)
{
    testing::InitGoogleTest(&argc, argv);
    std::string folder = (std::filesystem::temp_directory_path() / "bt_unit_XXXXXX").string();
    if (mkdtemp(folder.data()) == nullptr || setenv("BT_SERVICE_ROOT", folder.c_str(), 1) != 0) {
        std::perror("unit tests: no folder to work in");
        return 2;
    }
    std::filesystem::create_directories(folder + "/tmp");
    const int result = RUN_ALL_TESTS();
    std::filesystem::remove_all(folder);
    return result;
}
