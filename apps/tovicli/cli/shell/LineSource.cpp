// SPDX-License-Identifier: Apache-2.0
#include "shell/LineSource.h"

#include <cerrno>
#include <dlfcn.h>
#include <unistd.h>
#include <utility>

#include "plugins/Directory.h"

namespace Tovicli::Cli {

namespace {

constexpr std::size_t longestLine = std::size_t{1} << 20;

class PlainLines : public LineSource {
public:
    PlainLines(int descriptor, std::string prompt)
        : descriptor_(descriptor)
        , prompt_(std::move(prompt)) {}

    Line next() override {
        showPrompt();
        bool tooLong = false;
        for (;;) {
            std::size_t const end = buffer_.find('\n');
            if (end != std::string::npos) {
                std::string text = buffer_.substr(0, end);
                buffer_.erase(0, end + 1);
                return made(std::move(text), tooLong);
            }
            if (buffer_.size() > longestLine) {
                tooLong = true;
                buffer_.clear();
            }
            if (!more()) {
                bool const nothing = buffer_.empty() && !tooLong;
                return nothing ? Line() : made(std::exchange(buffer_, {}), tooLong);
            }
        }
    }

private:
    static Line made(std::string text, bool tooLong) {
        if (tooLong) {
            return {Line::Kind::TooLong};
        }
        if (text.ends_with('\r')) {
            text.pop_back();
        }
        return {Line::Kind::Text, std::move(text)};
    }

    void showPrompt() const {
        ssize_t const written = write(STDERR_FILENO, prompt_.data(), prompt_.size());
        static_cast<void>(written); // without a prompt it works too
    }

    /// @return false at the end
    bool more() {
        char bytes[65536];
        for (;;) {
            ssize_t const got = read(descriptor_, bytes, sizeof(bytes));
            if (got > 0) {
                buffer_.append(bytes, static_cast<std::size_t>(got));
                return true;
            }
            if (got == 0 || errno != EINTR) {
                return false;
            }
        }
    }

    int descriptor_;
    std::string prompt_;
    std::string buffer_;
};

} // namespace

std::unique_ptr<LineSource> plainLines(int descriptor, std::string prompt) {
    return std::make_unique<PlainLines>(descriptor, std::move(prompt));
}

std::unique_ptr<LineSource> editedLines(LineEditing const &editing, std::string &problem) {
    std::string const path = installedLibraries() + "/tovicli/libtovicli-lines.so";
    void *const library = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    void *const symbol = library != nullptr ? dlsym(library, "Tovicli_NewLineEditor") : nullptr;
    if (symbol == nullptr) {
        char const *const text = dlerror();
        problem = std::string("lines cannot be edited here: ") + (text != nullptr ? text : "unknown error");
        return plainLines(STDIN_FILENO, editing.prompt);
    }
    std::unique_ptr<LineSource> editor(reinterpret_cast<NewLineEditor *>(symbol)(editing));
    if (editor == nullptr) {
        problem = "lines cannot be edited on this terminal";
        return plainLines(STDIN_FILENO, editing.prompt);
    }
    return editor;
}

} // namespace Tovicli::Cli
