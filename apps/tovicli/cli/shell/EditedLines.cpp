// SPDX-License-Identifier: Apache-2.0
#include <cerrno>
#include <clocale>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <histedit.h>
#include <langinfo.h>
#include <memory>
#include <sys/stat.h>
#include <unistd.h>

#include "shell/LineSource.h"

namespace Tovicli::Cli {

namespace {

constexpr int mostRemembered = 1000;

extern "C" void noteInterrupt(int) {
    // A read that it interrupts ends with EINTR, which is all that is wanted.
}

/// Ctrl-C takes the line back, not the process, while a line is being edited.
class InterruptsLine {
public:
    InterruptsLine() {
        struct sigaction action {};
        action.sa_handler = noteInterrupt; // and no SA_RESTART
        sigaction(SIGINT, &action, &before_);
    }
    ~InterruptsLine() {
        sigaction(SIGINT, &before_, nullptr);
    }
    InterruptsLine(InterruptsLine const &) = delete;
    InterruptsLine &operator=(InterruptsLine const &) = delete;

private:
    struct sigaction before_ {};
};

class EditedLines : public LineSource {
public:
    explicit EditedLines(LineEditing const &editing)
        : editing_(editing) {
        useUtf8();
        editor_ = el_init("tovicli", stdin, stderr, stderr);
        history_ = history_init();
        if (editor_ == nullptr || history_ == nullptr) {
            return;
        }
        HistEvent event{};
        history(history_, &event, H_SETSIZE, mostRemembered);
        history(history_, &event, H_SETUNIQUE, 1);
        if (!editing_.historyFile.empty()) {
            history(history_, &event, H_LOAD, editing_.historyFile.c_str());
        }
        el_set(editor_, EL_CLIENTDATA, this);
        el_set(editor_, EL_EDITOR, "emacs");
        el_set(editor_, EL_SIGNAL, 1);
        el_set(editor_, EL_HIST, history, history_);
        el_set(editor_, EL_PROMPT, &EditedLines::prompt);
        el_set(editor_, EL_ADDFN, "tovicli-complete", "Complete the word before the cursor", &EditedLines::completed);
        el_set(editor_, EL_BIND, "^I", "tovicli-complete", nullptr);
        el_set(editor_, EL_BIND, "^R", "em-inc-search-prev", nullptr);
        el_source(editor_, nullptr); // what the user has in ~/.editrc
    }

    ~EditedLines() override {
        if (history_ != nullptr) {
            history_end(history_);
        }
        if (editor_ != nullptr) {
            el_end(editor_);
        }
    }
    EditedLines(EditedLines const &) = delete;
    EditedLines &operator=(EditedLines const &) = delete;

    bool works() const {
        return editor_ != nullptr && history_ != nullptr;
    }

    Line next() override {
        InterruptsLine const guard;
        int count = 0;
        errno = 0;
        char const *const typed = el_gets(editor_, &count);
        if (typed == nullptr || count <= 0) {
            if (errno == EINTR) {
                std::fputs("\n", stderr);
                el_reset(editor_);
                return {Line::Kind::Dropped};
            }
            std::fputs("\n", stderr); // behind the prompt
            return {};
        }
        std::string text(typed, static_cast<std::size_t>(count));
        while (text.ends_with('\n') || text.ends_with('\r')) {
            text.pop_back();
        }
        remember(text);
        return {Line::Kind::Text, text};
    }

private:
    static void useUtf8() {
        setlocale(LC_CTYPE, "");
        if (std::strcmp(nl_langinfo(CODESET), "UTF-8") != 0) {
            setlocale(LC_CTYPE, "C.UTF-8");
        }
    }

    static EditedLines *of(EditLine *editor) {
        EditedLines *self = nullptr;
        el_get(editor, EL_CLIENTDATA, &self);
        return self;
    }

    static char *prompt(EditLine *editor) {
        return of(editor)->editing_.prompt.data();
    }

    static unsigned char completed(EditLine *editor, int) {
        LineInfo const *const line = el_line(editor);
        std::string const before(line->buffer, line->cursor);
        LineCompletion const completion = of(editor)->editing_.complete(before);
        if (!completion.choices.empty()) {
            std::fputs("\n", stderr);
            for (std::string const &choice : completion.choices) {
                std::fprintf(stderr, "%s\n", choice.c_str());
            }
        }
        if (!completion.replacement.empty()) {
            el_deletestr(editor, static_cast<int>(completion.replaced));
            el_insertstr(editor, completion.replacement.c_str());
        }
        if (!completion.choices.empty()) {
            return CC_REDISPLAY;
        }
        return completion.replacement.empty() ? CC_REFRESH_BEEP : CC_REFRESH;
    }

    void remember(std::string const &text) {
        if (text.find_first_not_of(" \t") == std::string::npos) {
            return;
        }
        HistEvent event{};
        history(history_, &event, H_ENTER, text.c_str());
        if (!editing_.historyFile.empty()) {
            // Names of this host stand in it: for its user alone.
            mode_t const before = umask(077);
            history(history_, &event, H_SAVE, editing_.historyFile.c_str());
            umask(before);
        }
    }

    LineEditing editing_;
    EditLine *editor_ = nullptr;
    History *history_ = nullptr;
};

} // namespace

} // namespace Tovicli::Cli

Tovicli::Cli::LineSource *Tovicli_NewLineEditor(Tovicli::Cli::LineEditing const &editing) {
    auto editor = std::make_unique<Tovicli::Cli::EditedLines>(editing);
    return editor->works() ? editor.release() : nullptr;
}
