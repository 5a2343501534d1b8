# Recipes: the blocks of commands on a page for people, run one after the other as they stand there.
# shellcheck shell=bash

RECIPE_TITLES=()
RECIPES=()
RECIPES_DONE=0

# recipes_of PAGE: takes the ```sh blocks of a page, each with the heading that it stands under.
recipes_of() {
  local line title='' block='' inside=''
  while IFS= read -r line; do
    case $inside$line in
      '## '*) title=${line#'## '} ;;
      '```sh') inside=: block='' ;;
      '```'*) fail "$1 has a block that is no recipe, under '$title'" ;;
      ':```')
        inside=''
        RECIPE_TITLES+=("$title")
        RECIPES+=("$block")
        ;;
      :*) block+=$line$'\n' ;;
    esac
  done <"$1"
  [[ ! $inside && ${#RECIPES[@]} -gt 0 ]] || fail "$1 has no recipes, or one without an end"
}

# recipe NAME TITLE: runs the next block of the page on an appliance. It has to stand under that heading, and ends at
# the first command that fails.
recipe() {
  say "-- $2"
  expect_same 'the next recipe' "${RECIPE_TITLES[RECIPES_DONE]-none}" "$2"
  # In a directory for what the recipes write, and not on a terminal.
  OUTPUT=$(inside "$1" env --chdir=/usr/mero/etc sh -eux -c "${RECIPES[RECIPES_DONE]}" 2>&1 </dev/null) ||
    fail "the recipe '$2' ends with status $?: $OUTPUT"
  show <<<"$OUTPUT"
  RECIPES_DONE=$((RECIPES_DONE + 1))
}

# expect_all_recipes_done: there is no block on the page that was not run.
expect_all_recipes_done() {
  expect_same 'what is left of the recipes' '' "$(printf '%s\n' "${RECIPE_TITLES[@]:RECIPES_DONE}")"
}
