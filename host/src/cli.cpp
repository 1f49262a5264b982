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

struct RunArguments {
    std::string module;
    std::vector<std::string> scripts;
};

// Splits the arguments of `run`; returns an error or "".
std::string runArguments(const std::vector<std::string>& args, RunArguments& parsed) {
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
            parsed.scripts.push_back(a);
        }
    }
    if (parsed.scripts.empty()) return "run needs at least one script";
    return std::string();
}

// `run`: loads the module once and runs every script, each on a fresh instance.
int runCommand(const std::vector<std::string>& args, std::ostream& out, std::ostream& err) {
    RunArguments parsed;
    std::string error = runArguments(args, parsed);
    if (!error.empty()) return usageError(err, error);
    if (parsed.module.empty()) parsed.module = defaultModulePath();
    std::unique_ptr<Module> module = Module::load(parsed.module, &error);
    if (!module) {
        err << "hivelet-host: " << error << std::endl;
        return 2;
    }
    Runner runner(*module, out, err);
    unsigned failed = 0;
    for (const std::string& script : parsed.scripts) failed += runner.runFile(script) ? 0 : 1;
    out << parsed.scripts.size() << " script(s), " << failed << " failed" << std::endl;
    return failed ? 1 : 0;
}

// `menus` and `catalogue`: the editor's view of the module's events, for people or for tools.
int editorCommand(const std::vector<std::string>& args, std::ostream& out, std::ostream& err) {
    std::string path;
    for (size_t i = 1; i < args.size(); ++i) {
        if (args[i] == "--module" && i + 1 < args.size()) {
            path = args[++i];
        } else if (args[i].compare(0, 9, "--module=") == 0) {
            path = args[i].substr(9);
        } else {
            return usageError(err, args[0] + " takes no argument " + args[i]);
        }
    }
    if (path.empty()) path = defaultModulePath();
    std::string error;
    std::unique_ptr<Module> module = Module::load(path, &error);
    if (!module) {
        err << "hivelet-host: " << error << std::endl;
        return 2;
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
    if (command == "run") return runCommand(args, out, err);
    if (command == "check") return checkCommand(args, out, err);
    if (command == "menus" || command == "catalogue") return editorCommand(args, out, err);
    if (command == "dump-state") return dumpStateCommand(args, out, err);
    return usageError(err, "unknown command " + command);
}

}  // namespace hv::script
