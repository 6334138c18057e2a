// A folder for the files of one test.
#ifndef TELIX_TESTS_SUPPORT_TEMPORARYFOLDER_H
#define TELIX_TESTS_SUPPORT_TEMPORARYFOLDER_H

#include <filesystem>
#include <string>
#include <system_error>

#include <glib.h>
#include <gtest/gtest.h>

// Ends with the object, with all that is in it.
class TemporaryFolder {
public:
    TemporaryFolder() {
        GError* error = nullptr;
        gchar* folder = g_dir_make_tmp("telix-test-XXXXXX", &error);
        EXPECT_TRUE(folder) << error->message;
        g_clear_error(&error);
        m_path = folder ? folder : "";
        g_free(folder);
    }
    ~TemporaryFolder() {
        std::error_code ignored;
        std::filesystem::remove_all(m_path, ignored);
    }
    TemporaryFolder(const TemporaryFolder&) = delete;
    TemporaryFolder& operator=(const TemporaryFolder&) = delete;

    const std::string& path() const { return m_path; }
    std::string file(const std::string& name) const { return m_path + "/" + name; }

private:
    std::string m_path;
};

#endif
