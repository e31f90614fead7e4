// Lines on standard error.
#include "common/Talk.h"

#include <cstdio>

Talk& GetTalk() {
    static Talk talk;
    return talk;
}

void Say(const std::string& verb, const std::string& text) {
    fprintf(stderr, "qex %s: %s\n", verb.c_str(), text.c_str());
}

int Fail(const std::string& verb, const std::string& text, int status) {
    Say(verb, text);
    return status;
}
