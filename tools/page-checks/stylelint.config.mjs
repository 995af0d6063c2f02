// What is wrong, and not how it is laid out: short rules stand on one line each, as in a table.
export default { extends: "stylelint-config-recommended" };
