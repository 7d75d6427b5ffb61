# Completion of pelliko for fish.
set -l commands share text contacts status

complete -c pelliko -f
complete -c pelliko -s h -l help -d 'Show help'
complete -c pelliko -n "not __fish_seen_subcommand_from $commands" -l version -d 'Show the version'
complete -c pelliko -n "not __fish_seen_subcommand_from $commands" -a share -d 'Share files'
complete -c pelliko -n "not __fish_seen_subcommand_from $commands" -a text -d 'Share a text'
complete -c pelliko -n "not __fish_seen_subcommand_from $commands" -a contacts -d 'List people to share with'
complete -c pelliko -n "not __fish_seen_subcommand_from $commands" -a status -d 'Show how the uploads stand'
complete -c pelliko -n '__fish_seen_subcommand_from share' -F
complete -c pelliko -n '__fish_seen_subcommand_from share text' -l to -x -a '(pelliko contacts 2>/dev/null)' -d 'Recipient'
complete -c pelliko -n '__fish_seen_subcommand_from contacts status' -l json -d 'Print JSON'
complete -c pelliko -n '__fish_seen_subcommand_from status' -l follow -d 'Print changes until all have ended'
