#include "command_line.h"

#include <cwchar>
#include <string_view>

#include "failure.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

constexpr std::int32_t kMaxSize = 4096;

constexpr const wchar_t* kPageFolder = L"qelshow-page";

constexpr const wchar_t* kHelp =
    LR"(qelshow shows what Windows gets from the extension QelShellExt for a file, and
why a file has no thumbnail.

usage: qelshow COMMAND ... [OPTION ...]

commands:
  info FILE...           print everything that Windows gets for each file, and
                         what else its header says
  thumbnail FILE -o PNG  write the thumbnail of a file
  page FOLDER|FILE...    write a web page with the thumbnails and details of the
                         files
  doctor [FILE...]       check whether the extension works and, if not, say what
                         to do
  help COMMAND           explain a command
  --version              print the version of this program

FILE can be a pattern such as *.mrc. After "--" every argument is a FILE.

options of info, thumbnail and page:
  --server PATH  use this QelShellExt.dll instead of the registered one
  --size N       request thumbnails of N by N pixels (1 to 4096; default 256)

exit status (if several apply, the highest):
  0  done
  1  something cannot be read, written or loaded
  2  the command line is wrong
  3  a file is not of a supported kind
  4  a file has no thumbnail, for example because it is damaged
)";

constexpr const wchar_t* kInfoHelp =
    LR"(usage: qelshow info FILE... [--json] [--server PATH] [--size N]

Prints for each file:
  - the size of its thumbnail, or why it has none
  - values of its header that Windows does not show
  - the tip, which appears when the mouse rests on the file
  - the columns and the property sets, which some programs still use, with the
    declared and the returned types of the columns
  - the property store: the values in the Details view and in Properties

  --json         print one JSON document: {"schema": 3, "files": [...]}
  --server PATH  use this QelShellExt.dll instead of the registered one
  --size N       request thumbnails of N by N pixels (1 to 4096; default 256)

exit status: 0 done, 1 failed, 2 wrong command line, 3 a file is not of a
supported kind, 4 a file has no thumbnail; if several apply, the highest
)";

constexpr const wchar_t* kThumbnailHelp =
    LR"(usage: qelshow thumbnail FILE -o PNG [--server PATH] [--size N]

Writes the thumbnail of a file as a PNG image.

  -o, --out PNG  the file to write; - for standard output
  --server PATH  use this QelShellExt.dll instead of the registered one
  --size N       request a thumbnail of N by N pixels (1 to 4096; default 256)

exit status: 0 done, 1 failed, 2 wrong command line, 3 the file is not of a
supported kind, 4 the file has no thumbnail
)";

constexpr const wchar_t* kPageHelp =
    LR"(usage: qelshow page FOLDER|FILE... [--out DIR] [--server PATH] [--size N]

Writes DIR\index.html, a web page that shows the thumbnails of the files and
everything that "qelshow info" prints about them, and prints a table of the
files. You can move DIR: the page uses nothing outside it. For a FOLDER, the
page shows all supported files in it and in its subfolders.

  -o, --out DIR  the folder for the page, created if it does not exist (default:
                 qelshow-page in the current folder)
  --server PATH  use this QelShellExt.dll instead of the registered one
  --size N       request thumbnails of N by N pixels (1 to 4096; default 256)

exit status: 0 the page is written, even if files have no thumbnail, 1 failed,
2 wrong command line, 3 no page, because no file is of a supported kind
)";

constexpr const wchar_t* kDoctorHelp =
    LR"(usage: qelshow doctor [FILE...] [--json]

Checks whether the extension works on this computer:
  - whether its DLL is registered, exists and loads, and can create its objects
  - which handlers are registered for each file kind
  - whether settings of Windows hide thumbnails
  - whether the extension can read each FILE, and whether Windows shows what the
    extension returns for it
For each problem, it gives the reason and says what to do. A file kind for which
nothing is registered, for example because you did not install it, is not a
problem unless you name such a FILE.

  --json  print one JSON document: {"schema": 3, "classes": [...],
          "kinds": [...], "problems": [...], "files": [...]}

exit status: 0 everything works, 1 something does not work, or the kind of a
FILE is not registered, 2 wrong command line, 3 a file is not of a supported
kind, 4 a file has no thumbnail; if several apply, the highest
)";

struct CommandFacts {
  const wchar_t* name;
  const wchar_t* help;
  Command command;
  bool takesJson;
  bool takesOut;
  bool takesServer;  // and --size; such a command needs a file
};

constexpr CommandFacts kCommands[] = {
    {L"info", kInfoHelp, Command::kInfo, true, false, true},
    {L"thumbnail", kThumbnailHelp, Command::kThumbnail, false, true, true},
    {L"page", kPageHelp, Command::kPage, false, true, true},
    {L"doctor", kDoctorHelp, Command::kDoctor, true, false, false},
};

constexpr const wchar_t* kVersion = L"qelshow " QEL_VERSION "\n";

[[noreturn]] void WrongUsage(const std::wstring& sentence, std::wstring_view command = {}) {
  const std::wstring help =
      command.empty() ? L"qelshow --help" : L"qelshow " + std::wstring(command) + L" --help";
  throw Failure(sentence + L" See \"" + help + L"\".", kExitUsage);
}

CommandLine HelpLine(const wchar_t* text) {
  CommandLine line;
  line.helpText = text;
  return line;
}

std::int32_t ParseSize(const std::wstring& text, std::wstring_view command) {
  wchar_t* end = nullptr;
  const long size = std::wcstol(text.c_str(), &end, 10);
  if (text.empty() || *end != L'\0' || size < 1 || size > kMaxSize) {
    WrongUsage(L"--size takes a number from 1 to 4096, not \"" + text + L"\".", command);
  }
  return static_cast<std::int32_t>(size);
}

const CommandFacts& FindCommand(const std::wstring& name) {
  for (const CommandFacts& facts : kCommands) {
    if (name == facts.name) return facts;
  }
  WrongUsage(L"\"" + name + L"\" is not a command.");
}

bool IsHelp(const std::wstring& argument) {
  return argument == L"--help" || argument == L"-h" || argument == L"/?";
}

/// Reads the arguments after the command.
class OptionReader {
 public:
  OptionReader(const CommandFacts& facts, const std::vector<std::wstring>& arguments)
      : facts_(facts), arguments_(arguments) {}

  CommandLine Read() {
    CommandLine line;
    line.command = facts_.command;
    while (next_ < arguments_.size()) {
      const std::wstring& argument = arguments_[next_++];
      if (argument == L"--") {
        line.files.insert(line.files.end(), arguments_.begin() + static_cast<std::ptrdiff_t>(next_),
                          arguments_.end());
        break;
      }
      if (IsHelp(argument)) return HelpLine(facts_.help);
      if (argument.size() < 2 || argument.front() != L'-') {
        line.files.push_back(argument);
      } else if (!ReadOption(argument, line)) {
        WrongUsage(L"\"" + argument + L"\" is not an option of \"" + facts_.name + L"\".", facts_.name);
      }
    }
    Check(line);
    return line;
  }

 private:
  bool ReadOption(const std::wstring& argument, CommandLine& line) {
    const std::size_t equals = argument.find(L'=');
    const std::wstring name = argument.substr(0, equals);
    if (name == L"--json" && facts_.takesJson) {
      if (equals != std::wstring::npos)
        WrongUsage(L"\"" + argument + L"\": --json takes no value.", facts_.name);
      line.json = true;
    } else if (name == L"--server" && facts_.takesServer) {
      line.server = Value(argument, equals);
    } else if (name == L"--size" && facts_.takesServer) {
      line.size = ParseSize(Value(argument, equals), facts_.name);
    } else if ((name == L"--out" || name == L"-o") && facts_.takesOut) {
      line.out = Value(argument, equals);
    } else {
      return false;
    }
    return true;
  }

  /// Returns the value of an option, which follows the equals sign or is the next argument.
  std::wstring Value(const std::wstring& argument, std::size_t equals) {
    std::wstring value;
    if (equals != std::wstring::npos) {
      value = argument.substr(equals + 1);
    } else if (next_ < arguments_.size()) {
      value = arguments_[next_++];
    }
    if (value.empty()) WrongUsage(L"\"" + argument + L"\" needs a value.", facts_.name);
    return value;
  }

  /// Completes the command line. Throws Failure if it is invalid.
  void Check(CommandLine& line) const {
    if (line.files.empty() && facts_.takesServer) {
      WrongUsage(line.command == Command::kPage ? L"No file or folder is given." : L"No file is given.",
                 facts_.name);
    }
    if (line.command == Command::kThumbnail && line.files.size() > 1) {
      WrongUsage(L"thumbnail takes one file, not " + std::to_wstring(line.files.size()) + L".", facts_.name);
    }
    if (line.command == Command::kPage && line.out.empty()) line.out = kPageFolder;
    if (facts_.takesOut && line.out.empty()) {
      WrongUsage(L"Name the file to write with --out, for example --out grid.png.", facts_.name);
    }
    if (line.command == Command::kPage && line.out == L"-") {
      WrongUsage(L"A page cannot be written to standard output: name a folder with --out.", facts_.name);
    }
  }

  const CommandFacts& facts_;
  const std::vector<std::wstring>& arguments_;
  std::size_t next_ = 1;
};

}  // namespace

CommandLine ParseCommandLine(const std::vector<std::wstring>& arguments) {
  if (arguments.empty()) WrongUsage(L"No command is given.");
  const std::wstring& first = arguments.front();
  const bool isVersion = first == L"--version";
  if (isVersion || first == L"help" || IsHelp(first)) {
    const std::size_t count = first == L"help" ? 2 : 1;
    if (arguments.size() > count) WrongUsage(L"Unexpected argument \"" + arguments[count] + L"\".");
    if (isVersion) return HelpLine(kVersion);
    return HelpLine(arguments.size() == 2 ? FindCommand(arguments[1]).help : kHelp);
  }
  return OptionReader(FindCommand(arguments.front()), arguments).Read();
}

}  // namespace Qel::Lumetra::ShellExt::Show
