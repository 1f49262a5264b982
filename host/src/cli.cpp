// The hivelet-host command line.
#include <hivelet/catalogue.h>

#include <fstream>
#include <iterator>
#include <ostream>

#include "script_internal.h"

namespace hv::script {

namespace {

const char Usage[] =
    "usage: hivelet-host run [--module PATH] SCRIPT...\n"
    "       hivelet-host check SCRIPT...\n"
    "       hivelet-host menus [--module PATH]\n"
    "       hivelet-host catalogue [--module PATH]\n"
    "       hivelet-host dump-state FILE\n"
    "       hivelet-host --help\n"
    "\n"
    "Plays the authoring host for the Hivelet module: loads it, creates an instance per\n"
    "script and runs the script's conditions, actions and expressions, printing each event\n"
    "with its result and lastError, and checking the script's expectations.\n"
    "\n"
    "  run     run the scripts; the exit status is 0 when all passed, 1 when one failed\n"
    "  check   only parse the scripts and report malformed lines\n"
    "  menus   print the editor's view of the events: the three menus as trees, each event\n"
    "          with its code, display text and parameter titles\n"
    "  catalogue  print the same catalogue as JSON, with the object's identity strings and the\n"
    "             messages of the module's own error codes, for tools\n"
    "  dump-state  print a saved-state file (version, root key, last error, key); a\n"
    "              malformed file gives a message and exit status 1\n"
    "  --module PATH   the module to load; by default $HIVELET_MODULE, or else Hivelet.hzx\n"
    "                  beside this program\n"
    "\n"
    "Exit status 2: a usage error or a module that cannot be loaded.\n"
    "The script language is described in docs/scripts.md.\n";

// Reports a usage error with the usage text; the exit status for it.
int usageError(std::ostream& err, const std::string& message) {
    err << "hivelet-host: " << message << "\n\n" << Usage;
    return 2;
}

// What follows a command that loads the module: --module PATH (or --module=PATH), `--` to end
// the options, and the operands.
struct Arguments {
    std::string module;
    std::vector<std::string> operands;
};

// Splits the arguments after the command; returns a usage error or "".
std::string split(const std::vector<std::string>& args, Arguments& parsed) {
    bool options = true;
    for (size_t i = 1; i < args.size(); ++i) {
        const std::string& a = args[i];
        if (options && a == "--") {
            options = false;
        } else if (options && a == "--module") {
            if (++i == args.size()) return "--module needs a path";
            parsed.module = args[i];
        } else if (options && a.compare(0, 9, "--module=") == 0) {
            parsed.module = a.substr(9);
        } else if (options && a.size() > 1 && a[0] == '-') {
            return "unknown option " + a;
        } else {
            parsed.operands.push_back(a);
        }
    }
    if (parsed.module.empty()) parsed.module = defaultModulePath();
    return std::string();
}

// `run`, `menus` and `catalogue`: each loads the module once. `run` runs every script on a
// fresh instance; the other two print the editor's view of the module's events, for people or
// for tools.
int moduleCommand(const std::vector<std::string>& args, std::ostream& out, std::ostream& err) {
    Arguments parsed;
    std::string error = split(args, parsed);
    bool run = args[0] == "run";
    if (error.empty() && run && parsed.operands.empty()) error = "run needs at least one script";
    if (error.empty() && !run && !parsed.operands.empty())
        error = args[0] + " takes no argument " + parsed.operands[0];
    if (!error.empty()) return usageError(err, error);
    std::unique_ptr<Module> module = Module::load(parsed.module, &error);
    if (!module) {
        err << "hivelet-host: " << error << std::endl;
        return 2;
    }
    if (run) {
        Runner runner(*module, out, err);
        unsigned failed = 0;
        for (const std::string& script : parsed.operands) failed += runner.runFile(script) ? 0 : 1;
        out << parsed.operands.size() << " script(s), " << failed << " failed" << std::endl;
        return failed ? 1 : 0;
    }
    Editor editor;
    Catalogue catalogue(*module, editor);
    try {
        if (args[0] == "menus")
            printEditorView(catalogue, out);
        else
            printCatalogueJson(*module, catalogue, out);
    } catch (const std::exception& e) {
        err << "hivelet-host: " << e.what() << std::endl;
        return 1;
    }
    return 0;
}

// `check`: parses the scripts without loading a module.
int checkCommand(const std::vector<std::string>& args, std::ostream& out, std::ostream& err) {
    if (args.size() < 2) return usageError(err, "check needs at least one script");
    unsigned failed = 0;
    for (size_t i = 1; i < args.size(); ++i) {
        std::ifstream file(args[i], std::ios::binary);
        std::string text((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
        std::string error =
            !file ? args[i] + ": cannot read the script" : parse(args[i], text).error;
        if (!error.empty()) {
            err << error << '\n';
            ++failed;
        }
    }
    out << args.size() - 1 << " script(s), " << failed << " malformed" << std::endl;
    return failed ? 1 : 0;
}

// `dump-state`: a saved-state file, readably, or why it is not one.
int dumpStateCommand(const std::vector<std::string>& args, std::ostream& out, std::ostream& err) {
    if (args.size() != 2) return usageError(err, "dump-state needs one file");
    const std::string& path = args[1];
    std::ifstream file(path, std::ios::binary);
    std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(file)),
                               std::istreambuf_iterator<char>());
    SavedState state;
    std::string error;
    if (!file) error = "cannot read the file";
    if (error.empty() && readSavedState(bytes, state, &error)) {
        const char* root = rootKeyName(state.rootKeyIndex);
        out << "version " << state.version << "\nroot key index " << state.rootKeyIndex << " ("
            << (*root ? root : "invalid") << ")\nlast error " << state.lastError << "\n"
            << (state.hasKey ? "key " + quote(state.key) : std::string("no current key"))
            << std::endl;
        return 0;
    }
    err << path << ": " << error << std::endl;
    return 1;
}

}  // namespace

int commandLine(const std::vector<std::string>& args, std::ostream& out, std::ostream& err) {
    if (args.empty()) return usageError(err, "no command given");
    const std::string& command = args[0];
    if (command == "--help" || command == "-h" || command == "help") {
        out << Usage;
        return 0;
    }
    if (command == "run" || command == "menus" || command == "catalogue")
        return moduleCommand(args, out, err);
    if (command == "check") return checkCommand(args, out, err);
    if (command == "dump-state") return dumpStateCommand(args, out, err);
    return usageError(err, "unknown command " + command);
}

}  // namespace hv::script
