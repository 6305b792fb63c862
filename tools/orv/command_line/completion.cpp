#include "tools/orv/command_line/command.hpp"

namespace orv::tool {

namespace {

constexpr std::string_view beginning =
    R"bash(# Completion of the command orv for bash, made by orv --bash-completion.

_orv_types() { "${COMP_WORDS[0]}" types 2> /dev/null | sed -n 's/^orv\.\([^ ]*\).*/\1/p'; }

)bash";

constexpr std::string_view ending = R"bash(
_orv() {
  local current=${COMP_WORDS[COMP_CWORD]} previous=${COMP_WORDS[COMP_CWORD - 1]}
  local command=${_orv_commands%% *} words=''
  # An equals sign is a word of its own.
  local isBehindEquals=''
  [[ $current == = ]] && current='' isBehindEquals=1
  [[ $previous == = ]] && previous=${COMP_WORDS[COMP_CWORD - 2]} isBehindEquals=1
  if ((COMP_CWORD > 1)) && [[ " $_orv_commands " == *" ${COMP_WORDS[1]} "* ]]; then
    command=${COMP_WORDS[1]}
  fi
  if words=$(_orv_values "$command$previous"); then
    :
  elif [[ $isBehindEquals ]]; then
    words=$(_orv_types)
  elif [[ $current == -* ]]; then
    words=$(_orv_options "$command")
    ((COMP_CWORD == 1)) && words+=" $_orv_general"
  elif ((COMP_CWORD == 1)); then
    words=$_orv_commands
  else
    words=$(_orv_values "$command")
  fi
  mapfile -t COMPREPLY < <(compgen -W "$words" -- "$current")
  [[ ${COMPREPLY[0]-} == *= ]] && compopt -o nospace 2> /dev/null
}

complete -o default -F _orv orv
)bash";

constexpr const char* typeWords = "_orv_types";

// What bash runs for the words that an option's value can be; files are its own affair.
std::string valuesOf(const OptionDescription& option, const Command& command) {
  if (option.valueName == "TYPE") return typeWords;
  if (option.valueName.find("KIND") != std::string_view::npos) {
    const bool isPairing = option.valueName.ends_with("TYPE");
    std::string kinds = "echo";
    for (const auto& kind : VessaSessionMessageType::_protobuf_nameMap().entries())
      kinds += ' ' + std::string(kind.name) + (isPairing ? "=" : "");
    return isPairing ? kinds + "; " + typeWords : kinds;
  }
  std::string words(option.words);
  if (option.formats != nullptr) {
    words = listed({.allowed = (command.*option.formats).allowed});
    std::erase(words, ',');
  }
  return words.empty() ? ":" : "echo '" + words + "'";
}

// A function that answers for each word in its list, one a line; it fails for other words.
std::string function(std::string_view name, const std::string& lines) {
  return std::string(name) + "() {\n  case $1 in\n" + lines + "    *) return 1 ;;\n  esac\n}\n";
}

std::string variable(std::string_view name, const std::string& words) {
  return std::string(name) + "='" + words.substr(0, words.size() - 1) + "'\n";
}

}  // namespace

std::string bashCompletion() {
  std::string names;
  std::string options;
  std::string values;
  std::string general;
  for (const auto* const option : commandTable.options) general += std::string(option->name) + ' ';
  for (const Command& command : commandTable.commands) {
    const std::string name(command.name);
    names += name + ' ';
    if (command.operands == Operands::types) values += "    " + name + ") " + typeWords + " ;;\n";
    if (command.operands == Operands::command) values += "    " + name + ") echo \"$_orv_commands\" ;;\n";
    std::string words;
    for (const auto* const option : command.options) {
      words += ' ' + std::string(option->name);
      if (option->valueName.empty()) continue;
      values.append("    ").append(name);
      values += option->name;
      if (option->letter != '\0') values.append(" | ").append(name).append("-") += option->letter;
      values.append(") ").append(valuesOf(*option, command)).append(" ;;\n");
    }
    options.append("    ").append(name).append(") echo").append(words).append(" ;;\n");
  }
  return std::string(beginning) + variable("_orv_commands", names) + variable("_orv_general", general) +
         function("_orv_options", options) + function("_orv_values", values) + std::string(ending);
}

}  // namespace orv::tool
