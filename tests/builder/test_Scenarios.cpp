// Property sets built from end to end: every scenario of scenarios.txt is
// built, written back, and then trimmed or asked for holders as it says; the
// messages and every text written are compared with the file (a golden file:
// TSD_UPDATE_GOLDEN=1 rewrites the results). A design that builds must also
// read back as itself: its written text built again writes the same text.
//
// A scenario lists properties as "ref ELEMENT NAME = VALUE", "group NAME =
// VALUE" and "spec NAME = VALUE" (the name ends at the first " = "), and may
// say "mode reference" (the design's reference type is MM_TSREF) or "mode
// override" (later definitions replace earlier ones). After the build come
// "withdraw ELEMENT" (its references are trimmed) and "trash TSID" (moved to
// the trash by the caller), then one trim and a second that must find
// nothing; "holders NAME" is answered after them, "dump" (the builder's)
// right after the build.
#include "BuilderTestSupport.h"

#include <algorithm>
#include <sstream>

using namespace tsd_test;

namespace {

const char* const kReasons[] = {"no references",   "empty user group", "path endpoint",
                                "path THRU point", "period group",     "TIG of trashed spec",
                                "clock group",     "register group",   "pad group"};

NameValue definition(const std::string& rest) {
    const std::size_t eq = rest.find(" = ");
    if (eq != std::string::npos)
        return {rest.substr(0, eq), rest.substr(eq + 3)};
    if (rest.size() >= 2 && rest.compare(rest.size() - 2, 2, " =") == 0)
        return {rest.substr(0, rest.size() - 2), ""};
    ADD_FAILURE() << "no \" = \" in: " << rest;
    return {rest, ""};
}

std::string holders(Tsd_Design& design, const std::string& name) {
    Tsd_Group* group = design.findGroupByUserName(name.c_str(), false);
    if (group == nullptr)
        group = design.findClockGroupByNetName(name.c_str(), false);
    if (group == nullptr)
        group = design.findTIGByTSid(name.c_str(), false);
    Tsd_BaseObjList list;
    design.getGroupHolders(group, &list);
    std::string out = "holders of " + name + ":\n";
    for (Tsd_BaseObj* holder : objects(&list))
        out += std::string("  ") + holder->getUserString() + "\n";
    return out;
}

// The TIG groups installed: on specs, and the global one.
std::string installedTIGs(Tsd_Design& design) {
    std::string out;
    for (Tsd_BaseObj* obj : objects(design.getEndpointSpecList()))
        if (Tsd_TIGGroup* tig = obj->getEndpointSpec()->getIgnoreGroup())
            out += std::string("(") + obj->getEndpointSpec()->getTSid() + " holds the TIG group " +
                   tig->getName() + ")\n";
    return out + (design.getGlobalTIG() != nullptr ? "(the global TIG is installed)\n" : "");
}

// The result of one scenario; a design that builds must read back as itself.
std::string run(const std::string& title, const std::vector<std::string>& lines) {
    PropSet set;
    bool reference = false, allowOverride = false;
    std::vector<std::string> commands;
    for (const std::string& line : lines) {
        std::istringstream words(line);
        std::string word, element;
        words >> word;
        if (word == "ref") {
            words >> element;
            NameValue d = definition(line.substr(5 + element.size()));
            set.refs.push_back({element, d.first, d.second});
        } else if (word == "group" || word == "spec") {
            (word == "group" ? set.groups : set.specs)
                .push_back(definition(line.substr(word.size() + 1)));
        } else if (line == "mode reference" || line == "mode override") {
            (line == "mode reference" ? reference : allowOverride) = true;
        } else if (!word.empty() && word[0] != '#') {
            commands.push_back(line);
        }
    }

    MessageCapture capture;
    auto* design = new RecordingDesign(reference ? "MM_TSREF" : nullptr);
    std::string out, dump;
    Built built;
    {
        OpenBuilder builder(design, allowOverride);
        built = build(set, builder);
        if (std::count(commands.begin(), commands.end(), "dump") != 0)
            dump = dumpText(builder);
    }
    out += capture.sink.transcript();
    capture.sink.clear();
    if (built.design == nullptr) {
        delete design; // a failed build leaves it with us
        return out + "not built, error count " + std::to_string(built.errors) + "\n" + dump;
    }
    const PropSet written = built.writeBack();
    out += "built\n" + written.text() + installedTIGs(*design) + dump;

    if (!reference && !allowOverride) {
        Built again = build(written);
        EXPECT_TRUE(again.design != nullptr && again.writeBack() == written)
            << title << ": the written text does not read back as itself\n"
            << capture.sink.transcript();
    }
    capture.sink.clear();

    // Withdrawals and trashing, then one trim; holders after it.
    bool trim = false;
    for (const std::string& command : commands) {
        const std::string arg = command.substr(command.find(' ') + 1);
        if (command.rfind("withdraw ", 0) == 0) {
            auto& refs = built.refs;
            for (auto& ref : refs)
                if (ref.first == arg)
                    ref.second->trim();
            refs.erase(std::remove_if(refs.begin(), refs.end(),
                                      [&](const auto& ref) { return ref.first == arg; }),
                       refs.end());
            trim = true;
        } else if (command.rfind("trash ", 0) == 0) {
            design->moveEndpointSpecToTrash(design->findEndpointSpecByTSid(arg.c_str(), false));
            trim = true;
        } else if (command.rfind("holders ", 0) != 0 && command != "dump") {
            ADD_FAILURE() << title << ": unknown command " << command;
        }
    }
    if (trim) {
        out += std::string("trim: ") + (design->trim() ? "changed" : "nothing") + "\n";
        for (const auto& trashed : design->trashed)
            out += std::string("  trashed ") + trashed.first->getUserString() + " (" +
                   kReasons[trashed.second] + ")\n";
        design->trashed.clear();
        out += std::string("trim again: ") + (design->trim() ? "changed" : "nothing") + "\n";
        out += "written after the trim:\n" + built.writeBack().text() + installedTIGs(*design);
    }
    for (const std::string& command : commands)
        if (command.rfind("holders ", 0) == 0)
            out += holders(*design, command.substr(8));
    return out + capture.sink.transcript();
}

} // namespace

TEST(Scenarios, BuildWriteBackTrimAndHolders) {
    std::istringstream in(readFile(std::string(TSD_TEST_SOURCE_DIR) + "/builder/scenarios.txt"));
    std::string out, line, title;
    std::vector<std::string> lines;
    bool inResult = false;
    auto finish = [&] {
        if (!title.empty())
            out += "--- result\n" + run(title, lines) + "\n";
        lines.clear();
    };
    while (std::getline(in, line)) {
        if (line.rfind("=== ", 0) == 0) {
            finish();
            title = line.substr(4);
            inResult = false;
        } else if (line == "--- result") {
            inResult = true;
        }
        if (inResult)
            continue;
        out += line + "\n";
        if (!title.empty() && line.rfind("=== ", 0) != 0)
            lines.push_back(line);
    }
    finish();
    expectGolden("builder/scenarios.txt", out);
}
